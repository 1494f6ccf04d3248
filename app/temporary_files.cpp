#include "app/temporary_files.h"

#include "base/atomic_file.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/string_helpers.h"
#include "net/kept_download.h"

void CleanTemporaryFiles(const std::string& patchDir, const std::string& patchedDir, bool keepDownloads) {
    DiscardDirectory(patchedDir);
    if (patchDir.empty()) return;
    if (!keepDownloads) DiscardDirectory(PathJoin(patchDir, kDownloadRecordsFolderName));
    // The names the system wildcards "diff*.*", "patch*.*" and "tmp_*.*"
    // match: the dot is optional there, and Windows ignores letter case.
    for (const std::string& name : ListFileNames(patchDir)) {
        if (keepDownloads && IsKeptDownload(patchDir, name)) continue;
        for (const char* prefix : {"diff", "patch", "tmp_"}) {
            if (StartsWithIgnoringCase(name, prefix)) {
                DiscardFile(PathJoin(patchDir, name));
                break;
            }
        }
    }
    // A write of the description or the prepared-files list cut short
    // leaves its replacement beside it.
    for (const std::string& name : WorkFileNames()) RemoveLeftoverReplacement(PathJoin(patchDir, name));
    // Only when it is empty by now: anything else in it is not ours.
    static_cast<void>(DeleteDirectory(patchDir, false));
}

void RemoveLeftovers(const std::string& installDir, const std::string& patchDir, const std::string& patchedDir,
                     bool keepDownloads) {
    CleanTemporaryFiles(patchDir, patchedDir, keepDownloads);
    for (const std::string& record : InstallationRecordNames()) RemoveLeftoverReplacement(PathJoin(installDir, record));
}
