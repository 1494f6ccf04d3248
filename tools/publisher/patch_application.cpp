#include "tools/publisher/patch_application.h"

#include <filesystem>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "net/download_entry.h"
#include "net/http_downloader.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "tools/publisher/tree_listing.h"

void ApplyPatchFolder(const std::string& patchDir, const std::string& installDir, size_t workers) {
    PatchBatch batch;
    batch.installationFolder = installDir;
    batch.patchFolder = PathJoin(installDir, "tempPatch");
    batch.patchedFilesFolder = PathJoin(batch.patchFolder, "patched");
    batch.location = "file://" + NarrowEntryName(std::filesystem::absolute(ToFileSystemPath(patchDir)), patchDir);
    if (!MakeDirectories(batch.patchedFilesFolder)) throw Exception("Cannot create " + batch.patchedFilesFolder);

    PatchInfoFile info;
    info.Load(PathJoin(patchDir, "patchinfo.xml"));
    PatchProgressFile progress;
    progress.SetDirectory(installDir);
    StageServices services;
    services.workers = workers;
    PatchStages stages(batch, info, progress, services);

    HttpDownloader downloader;
    const auto list = MakeDownloadList(ArchivesInFetchOrder(info), batch.location, batch.patchFolder);
    if (!list.empty()) downloader.Start(list, false);
    stages.Prepare(downloader);
    stages.Apply(nullptr);
    DiscardDirectory(batch.patchFolder);
}
