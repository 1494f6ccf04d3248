#include "app/overall_progress.h"

#include <algorithm>

int32_t OverallProgress(int32_t doneFiles, int32_t totalFiles, uint32_t bytesDone, uint32_t bytesTotal) {
    if (totalFiles <= 0) return 1000;
    const int32_t base = static_cast<int32_t>(static_cast<int64_t>(doneFiles) * 1000 / totalFiles);
    double share = 0.0;
    if (bytesTotal != 0) {
        const double slot = 1000.0 / totalFiles;
        // A server that sends no length is measured against a guessed total
        // that the file may outgrow; the archive never takes more than its slot.
        share = std::min(static_cast<double>(bytesDone) / bytesTotal, 1.0) * slot;
    }
    return std::clamp(base + static_cast<int32_t>(share), 0, 1000);
}
