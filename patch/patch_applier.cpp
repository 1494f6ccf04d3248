#include "patch/patch_applier.h"

#include "base/archive_source.h"
#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/item_path.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/status_interfaces.h"
#include "patch/patch_archive.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/vcdiff_decoder.h"

namespace {

const char* const kLogSource = "PatchApplier";
const char* const kDeltaFileName = "diffTempFile.dz";

// Every folder from root down to the one that holds path, root included,
// when path lies below root: the folders whose entries may change when
// path is created with its missing parents.
std::vector<std::string> FoldersFromRootTo(const std::string& path, const std::string& root) {
    const std::string relative = PathBelow(path, root);
    if (relative.empty()) return {};
    std::string top = PathJoin(root, "");
    top.pop_back();
    std::vector<std::string> folders{top};
    for (size_t end = relative.find(kPathSeparator); end != std::string::npos;
         end = relative.find(kPathSeparator, end + 1)) {
        folders.push_back(PathJoin(root, relative.substr(0, end)));
    }
    return folders;
}

// Makes sure what stage one wrote is on the disk, not only in a cache,
// before the installation starts to depend on it.
void FlushToDisk(const std::string& path) {
    FileStream file;
    file.OpenForWrite(path);
    file.Flush();
}

}  // namespace

PatchApplier::PatchApplier(const PatchBatch& work, PatchInfoFile& description, PatchProgressFile& progress,
                           const StageServices& stageServices)
    : batch(work), patchInfo(description), progressFile(progress), services(stageServices) {
    filesTotal = patchInfo.CountFileAndDirectoryChanges();
}

void PatchApplier::CheckCancel() const {
    if (IsCancelled(services.cancel)) throw Exception("", ErrorCode::UserCancelled);
}

void PatchApplier::ReportProgress(const std::string& path) const {
    if (services.statusView == nullptr || filesTotal <= 0) return;
    services.statusView->OnApplyProgress(GetFileName(path), filesDone * 1000 / filesTotal);
}

void PatchApplier::WaitForArchive(IArchiveSource& archives, const std::string& archiveName) const {
    switch (archives.WaitForArchive(archiveName)) {
        case ArchiveState::Arrived:
            return;
        case ArchiveState::Cancelled:
            throw Exception("", ErrorCode::UserCancelled);
        case ArchiveState::Corrupt:
            throw Exception("The patch archive " + archiveName + " does not match its size or SHA-256.",
                            ErrorCode::CorruptData);
        case ArchiveState::Failed:
            break;
    }
    throw Exception("Failed to download patch file.", ErrorCode::FileNotFound);
}

void PatchApplier::RequireSafe(const std::string& path, const std::vector<std::string>& ownNames) const {
    if (!IsSafeItemPath(path, ownNames)) throw Exception("Unsafe path in patch description: \"" + path + "\"");
}

// Every name of the batch is checked before the first file is written or
// deleted, so a hostile description fails without touching anything. An
// item may not reach the updater's own work folders and records: deleting
// the prepared files or the progress record half-way would lose the batch,
// and the installation data or the uninstall record the installation.
void PatchApplier::CheckItemPaths() {
    std::vector<std::string> ownNames = InstallationRecordNames();
    for (const std::string& folder : {batch.patchFolder, batch.patchedFilesFolder}) {
        const std::string relative = PathBelow(folder, batch.installationFolder);
        if (!relative.empty()) ownNames.push_back(relative);
    }
    for (const std::string& record : {progressFile.GetRecordPath(), progressFile.GetAlternativeRecordPath()}) {
        const std::string relative = PathBelow(record, batch.installationFolder);
        if (!relative.empty()) ownNames.push_back(relative);
    }
    patchInfo.ResetIterators();
    std::string path;
    std::string archive;
    while (patchInfo.NextDiffFile(path, archive)) {
        RequireSafe(path, ownNames);
        RequireSafe(archive, {});
    }
    while (patchInfo.NextNewFile(path, archive)) {
        RequireSafe(path, ownNames);
        RequireSafe(archive, {});
    }
    while (patchInfo.NextDeletedFile(path)) RequireSafe(path, ownNames);
    while (patchInfo.NextDeletedDirectory(path)) RequireSafe(path, ownNames);
    while (patchInfo.NextNewDirectory(path)) RequireSafe(path, ownNames);
    patchInfo.ResetIterators();
}

void PatchApplier::PreparePatch(IArchiveSource& archives) {
    LogEntry(LogLevel::Trace, kLogSource, 55).Stream() << "PreparePatch Start";
    CheckItemPaths();
    LogEntry(LogLevel::Trace, kLogSource, 66).Stream() << "Applying diff files";
    std::string path;
    std::string archive;
    while (patchInfo.NextDiffFile(path, archive)) {
        CheckCancel();
        ++filesDone;
        ReportProgress(path);
        PrepareDiffFile(archives, path, archive);
    }
    LogEntry(LogLevel::Trace, kLogSource, 132).Stream() << "Adding new files";
    while (patchInfo.NextNewFile(path, archive)) {
        CheckCancel();
        ++filesDone;
        ReportProgress(path);
        PrepareNewFile(archives, path, archive);
    }
    // A cancel during the last extraction must not pass for a finished
    // stage: stage two would move a cut-off file in.
    CheckCancel();
    MakePreparedFilesDurable();
}

void PatchApplier::PrepareDiffFile(IArchiveSource& archives, const std::string& path, const std::string& archive) {
    WaitForArchive(archives, archive);
    const std::string deltaPath = PathJoin(batch.patchFolder, kDeltaFileName);
    PatchArchive(PathJoin(batch.patchFolder, archive)).DecodeFile(path, deltaPath, services.cancel);
    CheckCancel();
    const std::string folder = PathJoin(batch.patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder)) MakeDirectories(folder);

    const std::string sourcePath = PathJoin(batch.installationFolder, path);
    try {
        FileStream source;
        FileStream delta;
        FileStream target;
        source.Open(sourcePath);
        delta.Open(deltaPath);
        // Created empty: a longer leftover of an earlier attempt must not
        // keep stale bytes at its end.
        target.Create(PathJoin(batch.patchedFilesFolder, path));
        LogEntry(LogLevel::Trace, kLogSource, 107).Stream()
            << "Patching file " << path << ". Size: " << source.GetLength();
        VcdiffDecoder::Decode(&source, &delta, &target, services.cancel);
        target.Flush();
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::UserCancelled) throw;
        throw Exception(
            "Failed to apply delta file " + deltaPath + " on " + sourcePath + ". Source message: " + error.message,
            ErrorCode::DeltaFailed);
    }
    RemoveFile(deltaPath);
}

void PatchApplier::PrepareNewFile(IArchiveSource& archives, const std::string& path, const std::string& archive) {
    const std::string folder = PathJoin(batch.patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder)) MakeDirectories(folder);
    WaitForArchive(archives, archive);
    const std::string target = PathJoin(batch.patchedFilesFolder, path);
    PatchArchive(PathJoin(batch.patchFolder, archive)).DecodeFile(path, target, services.cancel);
    FlushToDisk(target);
}

// Stage two starts to depend on the prepared files with its first record:
// a power cut after it must not find them empty or missing. The files'
// data is flushed as each is written; here their names follow, every
// folder from the installation down to each prepared file.
void PatchApplier::MakePreparedFilesDurable() {
    std::vector<std::string> prepared;
    CollectFiles(batch.patchedFilesFolder, prepared);
    std::set<std::string> folders;
    const std::string root = PathBelow(batch.patchedFilesFolder, batch.installationFolder).empty()
                                 ? batch.patchedFilesFolder
                                 : batch.installationFolder;
    for (const std::string& file : prepared) {
        for (const std::string& folder : FoldersFromRootTo(file, root)) folders.insert(folder);
    }
    for (const std::string& folder : folders) SyncFolder(folder);
}

void PatchApplier::NoteChanged(const std::string& path) {
    for (const std::string& folder : FoldersFromRootTo(path, batch.installationFolder)) changedFolders.insert(folder);
}

// Each action is on the disk before the next one is recorded: a record
// that outlived a power cut must never name an action after one the cut
// undid, or the resumed run would skip the undone one.
void PatchApplier::ApplyPatch(const std::optional<ResumePoint>& recordedAction) {
    LogEntry(LogLevel::Trace, kLogSource, 161).Stream() << "ApplyPatch Start";
    resumeAt = recordedAction;
    CheckItemPaths();
    std::string path;
    while (patchInfo.NextDeletedFile(path)) {
        const std::string target = PathJoin(batch.installationFolder, path);
        if (ShouldApply(path)) {
            RemoveFile(target);
            SyncFolder(GetParentDirectory(target));
        }
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo.NextDeletedDirectory(path)) {
        const std::string target = PathJoin(batch.installationFolder, path);
        if (ShouldApply(path)) {
            DeleteDirectory(target, true);
            SyncFolder(GetParentDirectory(target));
        }
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo.NextNewDirectory(path)) {
        const std::string target = PathJoin(batch.installationFolder, path);
        if (ShouldApply(path)) {
            MakeDirectories(target);
            for (const std::string& folder : FoldersFromRootTo(target, batch.installationFolder)) SyncFolder(folder);
        }
        ++filesDone;
        ReportProgress(path);
    }

    // The moves begin. From here on a resumed run must not repeat any
    // deletion: the item it would repeat may already have been replaced by
    // a moved file of the same name (a file deleted and added anew, or a
    // folder that became a file). A record past the last action says so.
    Record(actionCounter, "");
    resumeAt.reset();

    std::vector<std::string> prepared;
    CollectFiles(batch.patchedFilesFolder, prepared);
    for (const std::string& file : prepared) {
        const std::string destination = DestinationOf(file);
        MoveWithRetry(file, destination);
        NoteChanged(destination);
    }
    // Everything must be durable before the caller records the new version.
    for (const std::string& folder : changedFolders) SyncFolder(folder);
}

// The write-ahead gate. Normally each action is recorded before it is
// carried out. When resuming, actions before the recorded one were done
// before the interruption and are skipped; the recorded one is carried out
// again. An action is the recorded one only when both its ordinal and its
// path agree: a path alone can stand for two actions (a folder deleted and
// then created anew), and repeating the deletion after the moves had begun
// would throw away files already moved into it.
bool PatchApplier::ShouldApply(const std::string& path) {
    if (!resumeAt) {
        Record(actionCounter, path);
        ++actionCounter;
        return true;
    }
    const int32_t recorded = resumeAt->actionIndex;
    const bool isRecorded = recorded == -1 || (recorded == actionCounter && path == resumeAt->file);
    // Counting the repeated action too keeps later ordinals true.
    ++actionCounter;
    if (!isRecorded) return false;
    resumeAt.reset();
    return true;
}

// An action that could not be recorded is not carried out: after a crash
// the next run would not know it had begun.
void PatchApplier::Record(int32_t action, const std::string& path) {
    progressFile.SetActionIndex(action);
    progressFile.SetFile(path);
    if (!progressFile.WriteRecord()) {
        throw Exception("Failed to write the progress record " + progressFile.GetRecordPath(), ErrorCode::StepFailed);
    }
}

std::string PatchApplier::DestinationOf(const std::string& preparedFile) const {
    // Every collected file lies below the patched-files folder; only that
    // leading part is exchanged for the installation folder.
    const std::string& prepared = batch.patchedFilesFolder;
    if (preparedFile.compare(0, prepared.size(), prepared) != 0) return preparedFile;
    return PathJoin(batch.installationFolder, preparedFile.substr(prepared.size()));
}

void PatchApplier::MoveWithRetry(const std::string& source, const std::string& destination) {
    // A prepared file's folder normally exists by now (a "new" folder item,
    // or an earlier file); when a description forgot it, make it rather
    // than ask the player to fix what they cannot.
    const std::string folder = GetParentDirectory(destination);
    if (!folder.empty() && !FileExists(folder)) MakeDirectories(folder);
    while (!MoveFileReplacing(source, destination)) {
        if (services.retryQuestion == nullptr || !services.retryQuestion->AskRetryMove(source, destination)) {
            throw Exception("Failed to move file from " + source + " to " + destination, ErrorCode::StepFailed);
        }
    }
}
