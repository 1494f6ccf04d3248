#include "patch/patch_stages.h"

#include <set>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/item_path.h"
#include "base/log.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"

std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info) {
    std::vector<std::string> names;
    std::set<std::string> seen;
    const auto add = [&](const std::string& archive) {
        // The name becomes a file name in the patch folder before the
        // applier ever sees the description.
        if (!IsSafeItemPath(archive)) {
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
    applier.ProtectNames(batch.protectedNames);
    applier.Init(&info, &progress, batch.installationFolder, batch.patchedFilesFolder, batch.patchFolder, view, source);
    prepared = true;
    applier.PreparePatch();
}

void PatchStages::Apply(const PatchBatch& batch, IStatusView* view, const VersionStore& storeVersion) {
    // A resumed batch did not run stage one in this process.
    if (!prepared) {
        applier.ProtectNames(batch.protectedNames);
        applier.Init(&info, &progress, batch.installationFolder, batch.patchedFilesFolder, batch.patchFolder, view,
                     nullptr);
    }
    // A description changed since stage one must fail before the record.
    applier.CheckItemPaths();
    progress.SetPatchPath(batch.patchFolder);
    progress.SetPatchedFilesPath(batch.patchedFilesFolder);
    progress.SetPatchUri(batch.patchUri);
    progress.SetVersion(batch.version);
    // The record comes before the mark "-1": interrupted between the two,
    // the installation still carries its old version, so the next start
    // drops the record and the old installation stands. The other way
    // round it would find "-1" without a record and reinstall everything.
    if (!progress.resuming) {
        progress.SetActionIndex(-1);
        progress.SetFile("");
        if (!progress.WriteRecord()) {
            throw Exception("Failed to write the progress record " + progress.GetRecordPath(), ErrorCode::StepFailed);
        }
    }
    Store(storeVersion, "-1");
    applier.ApplyPatch();
    Store(storeVersion, batch.version);
    // The spare copy first: found alone, it would be taken for the record.
    RemoveFile(progress.GetAlternativeRecordPath());
    RemoveFile(progress.GetRecordPath());
}

void PatchStages::Store(const VersionStore& storeVersion, const std::string& version) {
    if (storeVersion && !storeVersion(version)) {
        throw Exception("Failed to store the installed version " + version, ErrorCode::StepFailed);
    }
}

InterruptedBatch FindInterruptedBatch(const std::string& installedVersion, PatchProgressFile& progress) {
    progress.resuming = false;
    if (installedVersion != "-1") {
        // Stage two writes its first record before it marks the
        // installation as in change and removes the record only after it
        // stored the new version: a record beside any other version is a
        // leftover of a batch that never began or already ended.
        for (const std::string& record : {progress.GetAlternativeRecordPath(), progress.GetRecordPath()}) {
            if (FileExists(record)) {
                LOG(Info) << "Removing the leftover progress record " << record;
                RemoveFile(record);
            }
        }
        return InterruptedBatch::None;
    }
    try {
        progress.resuming = progress.Recover();
    } catch (const Exception& error) {
        LOG(Error) << error.message;
    }
    return progress.resuming ? InterruptedBatch::Resume : InterruptedBatch::Reinstall;
}
