#include "patch/patch_stages.h"

#include <set>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/relative_path.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"

std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info) {
    std::vector<std::string> names;
    std::set<std::string> seen;
    const auto add = [&](const std::string& archive) {
        // The name becomes a file name in the patch folder before the
        // applier ever sees the description.
        if (!IsContainedRelativePath(archive)) {
            throw Exception("Unsafe archive name in patch description: \"" + archive + "\"");
        }
        if (seen.insert(archive).second) names.push_back(archive);
    };
    std::string path;
    std::string archive;
    info.ResetIterators();
    while (info.NextDiffFile(path, archive)) add(archive);
    while (info.NextNewFile(path, archive)) add(archive);
    info.ResetIterators();
    return names;
}

void PatchStages::Prepare(const PatchBatch& batch, IArchiveSource* source, IStatusView* view) {
    applier.Init(&info, &progress, batch.installationFolder, batch.patchedFilesFolder, batch.patchFolder, view, source);
    prepared = true;
    applier.PreparePatch();
}

void PatchStages::Apply(const PatchBatch& batch, IStatusView* view, const VersionStore& storeVersion) {
    // A resumed batch did not run stage one in this process.
    if (!prepared) {
        applier.Init(&info, &progress, batch.installationFolder, batch.patchedFilesFolder, batch.patchFolder, view,
                     nullptr);
    }
    if (storeVersion) storeVersion("-1");
    progress.SetPatchPath(batch.patchFolder);
    progress.SetPatchedFilesPath(batch.patchedFilesFolder);
    progress.SetPatchUri(batch.patchUri);
    progress.SetVersion(batch.version);
    if (!progress.resuming) {
        progress.SetActionIndex(-1);
        progress.SetFile("");
        progress.WriteRecord();
    }
    applier.ApplyPatch();
    if (storeVersion) storeVersion(batch.version);
    // The spare copy first: found alone, it would be taken for the record.
    RemoveFile(progress.GetAlternativeRecordPath());
    RemoveFile(progress.GetRecordPath());
}
