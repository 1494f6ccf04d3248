#include "app/temporary_files.h"

#include "base/file_operations.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/string_helpers.h"
#include "net/kept_download.h"

void CleanTemporaryFiles(const std::string& patchDir, const std::string& patchedDir, bool keepDownloads) {
    DeleteDirectory(patchedDir, true);
    if (patchDir.empty()) return;
    if (!keepDownloads) DeleteDirectory(PathJoin(patchDir, kDownloadRecordsFolderName), true);
    // The names the system wildcards "diff*.*", "patch*.*" and "tmp_*.*"
    // match: the dot is optional there, and Windows ignores letter case.
    for (const std::string& name : ListFileNames(patchDir)) {
        if (keepDownloads && IsKeptDownload(patchDir, name)) continue;
        for (const char* prefix : {"diff", "patch", "tmp_"}) {
            if (StartsWithIgnoringCase(name, prefix)) {
                RemoveFile(PathJoin(patchDir, name));
                break;
            }
        }
    }
    DeleteDirectory(patchDir, false);
}
