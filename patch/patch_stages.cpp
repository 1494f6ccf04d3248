#include "patch/patch_stages.h"

#include <set>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/item_path.h"
#include "base/log.h"
#include "base/record_names.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"

std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info) {
    std::vector<std::string> names;
    std::set<std::string> seen;
    const auto add = [&](const std::string& archive) {
        // The name becomes a file name in the patch folder before the
        // applier ever sees the description.
        if (!IsUsableArchiveName(archive)) {
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

void PatchStages::Prepare(IArchiveSource& archives) { applier.PreparePatch(archives); }

void PatchStages::Apply(IInstallationRecords* records, const std::optional<ResumePoint>& resumeAt) {
    // A description changed since stage one, or prepared files lost, must
    // fail before the record.
    applier.CheckItemPaths();
    applier.CheckPreparedFiles(resumeAt);
    progressFile.SetPatchPath(work.patchFolder);
    progressFile.SetPatchedFilesPath(work.patchedFilesFolder);
    progressFile.SetPatchUri(work.location);
    progressFile.SetVersion(work.version);
    // The record comes before the mark "-1": interrupted between the two,
    // the installation still carries its old version, so the next start
    // drops the record and the old installation stands. The other way
    // round it would find "-1" without a record and reinstall everything.
    if (!resumeAt) {
        progressFile.SetActionIndex(-1);
        progressFile.SetFile("");
        if (!progressFile.WriteRecord()) {
            throw Exception("Failed to write the progress record " + progressFile.GetRecordPath(),
                            ErrorCode::StepFailed);
        }
    }
    if (records != nullptr) records->StoreVersion("-1");
    applier.ApplyPatch(resumeAt);
    // While the installation is still in change: interrupted here, the next
    // start resumes and records the batch once more, which changes nothing.
    // Recorded after the new version, a cut in between would lose it.
    if (records != nullptr) records->RecordInstalledBatch(work, info);
    if (records != nullptr) records->StoreVersion(work.version);
    // The spare copy first: found alone, it would be taken for the record.
    // One that cannot go is a leftover beside a settled version, which the
    // next start removes.
    DiscardFile(progressFile.GetAlternativeRecordPath());
    DiscardFile(progressFile.GetRecordPath());
}

InterruptedBatch FindInterruptedBatch(const std::string& installedVersion, PatchProgressFile& progress) {
    InterruptedBatch found;
    if (installedVersion != "-1") {
        // Stage two writes its first record before it marks the
        // installation as in change and removes the record only after it
        // stored the new version: a record beside any other version is a
        // leftover of a batch that never began or already ended.
        for (const std::string& record : {progress.GetAlternativeRecordPath(), progress.GetRecordPath()}) {
            if (FileExists(record)) {
                LOG(Info) << "Removing the leftover progress record " << record;
                DiscardFile(record);
            }
        }
        return found;
    }
    found.kind = InterruptedBatch::Kind::Reinstall;
    try {
        if (!progress.Recover()) return found;
    } catch (const Exception& error) {
        LOG(Error) << error.message;
        return found;
    }
    found.kind = InterruptedBatch::Kind::Resume;
    found.batch.patchFolder = progress.GetPatchPath();
    found.batch.patchedFilesFolder = progress.GetPatchedFilesPath();
    found.batch.location = progress.GetPatchUri();
    found.batch.version = progress.GetVersion();
    found.resumeAt = ResumePoint{progress.GetActionIndex(), progress.GetFile()};
    return found;
}
