#include "patch/patch_applier.h"

#include <set>

#include "base/archive_source.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/relative_path.h"
#include "base/status_interfaces.h"
#include "patch/patch_archive.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/vcdiff_decoder.h"

namespace {

const char* const kLogSource = "PatchApplier";
const char* const kDeltaFileName = "diffTempFile.dz";

void RequireContained(const std::string& path) {
    if (!IsContainedRelativePath(path)) {
        throw Exception("Unsafe path in patch description: \"" + path + "\"");
    }
}

// Makes sure what stage one wrote is on the disk, not only in a cache,
// before the installation starts to depend on it.
void FlushToDisk(const std::string& path) {
    try {
        FileStream file;
        file.OpenForWrite(path);
        file.Flush();
    } catch (const Exception& error) {
        LOG_AS(kLogSource, Error) << "Could not flush " << path << ": " << error.message;
    }
}

}  // namespace

void PatchApplier::Init(PatchInfoFile* info, PatchProgressFile* progress, const std::string& installation,
                        const std::string& patchedFiles, const std::string& patch, IStatusView* view,
                        IArchiveSource* source) {
    patchInfo = info;
    progressFile = progress;
    installationFolder = installation;
    patchedFilesFolder = patchedFiles;
    patchFolder = patch;
    statusView = view;
    archives = source;
    cancelRequested = false;
    filesDone = 0;
    actionCounter = 0;
    filesTotal = patchInfo->CountFileAndDirectoryChanges();
}

void PatchApplier::CheckCancel() const {
    if (cancelRequested) throw Exception("", ErrorCode::UserCancelled);
}

void PatchApplier::ReportProgress(const std::string& path) const {
    if (statusView == nullptr || filesTotal <= 0) return;
    statusView->OnApplyProgress(GetFileName(path), filesDone * 1000 / filesTotal);
}

void PatchApplier::WaitForArchive(const std::string& archiveName) const {
    if (archives == nullptr) throw Exception("No downloader set.");
    switch (archives->WaitForArchive(archiveName)) {
        case ArchiveState::Arrived:
            return;
        case ArchiveState::Cancelled:
            throw Exception("", ErrorCode::UserCancelled);
        case ArchiveState::Failed:
            break;
    }
    throw Exception("Failed to download patch file.", ErrorCode::FileNotFound);
}

// Every path of the batch is checked before the first file is written or
// deleted, so a hostile description fails without touching anything.
void PatchApplier::CheckItemPaths() {
    patchInfo->ResetIterators();
    std::string path;
    std::string archive;
    while (patchInfo->NextDiffFile(path, archive)) {
        RequireContained(path);
        RequireContained(archive);
    }
    while (patchInfo->NextNewFile(path, archive)) {
        RequireContained(path);
        RequireContained(archive);
    }
    while (patchInfo->NextDeletedFile(path)) RequireContained(path);
    while (patchInfo->NextDeletedDirectory(path)) RequireContained(path);
    while (patchInfo->NextNewDirectory(path)) RequireContained(path);
    patchInfo->ResetIterators();
}

void PatchApplier::PreparePatch() {
    LogEntry(LogLevel::Trace, kLogSource, 55).Stream() << "PreparePatch Start";
    CheckItemPaths();
    LogEntry(LogLevel::Trace, kLogSource, 66).Stream() << "Applying diff files";
    std::string path;
    std::string archive;
    while (patchInfo->NextDiffFile(path, archive)) {
        CheckCancel();
        ++filesDone;
        ReportProgress(path);
        PrepareDiffFile(path, archive);
    }
    LogEntry(LogLevel::Trace, kLogSource, 132).Stream() << "Adding new files";
    while (patchInfo->NextNewFile(path, archive)) {
        CheckCancel();
        ++filesDone;
        ReportProgress(path);
        PrepareNewFile(path, archive);
    }
}

void PatchApplier::PrepareDiffFile(const std::string& path, const std::string& archive) {
    WaitForArchive(archive);
    const std::string deltaPath = PathJoin(patchFolder, kDeltaFileName);
    PatchArchive(PathJoin(patchFolder, archive)).DecodeFile(path, deltaPath);
    CheckCancel();
    const std::string folder = PathJoin(patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder)) MakeDirectories(folder);

    const std::string sourcePath = PathJoin(installationFolder, path);
    try {
        FileStream source;
        FileStream delta;
        FileStream target;
        source.Open(sourcePath);
        delta.Open(deltaPath);
        // Created empty: a longer leftover of an earlier attempt must not
        // keep stale bytes at its end.
        target.Create(PathJoin(patchedFilesFolder, path));
        LogEntry(LogLevel::Trace, kLogSource, 107).Stream()
            << "Patching file " << path << ". Size: " << source.GetLength();
        VcdiffDecoder::Decode(&source, &delta, &target);
    } catch (const Exception& error) {
        throw Exception(
            "Failed to apply delta file " + deltaPath + " on " + sourcePath + ". Source message: " + error.message,
            ErrorCode::DeltaFailed);
    }
    RemoveFile(deltaPath);
}

void PatchApplier::PrepareNewFile(const std::string& path, const std::string& archive) {
    const std::string folder = PathJoin(patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder)) MakeDirectories(folder);
    WaitForArchive(archive);
    PatchArchive(PathJoin(patchFolder, archive)).DecodeFile(path, PathJoin(patchedFilesFolder, path));
}

void PatchApplier::ApplyPatch() {
    LogEntry(LogLevel::Trace, kLogSource, 161).Stream() << "ApplyPatch Start";
    CheckItemPaths();
    std::string path;
    while (patchInfo->NextDeletedFile(path)) {
        if (ShouldApply(path)) RemoveFile(PathJoin(installationFolder, path));
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo->NextDeletedDirectory(path)) {
        if (ShouldApply(path)) DeleteDirectory(PathJoin(installationFolder, path), true);
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo->NextNewDirectory(path)) {
        if (ShouldApply(path)) MakeDirectories(PathJoin(installationFolder, path));
        ++filesDone;
        ReportProgress(path);
    }

    std::vector<std::string> prepared;
    CollectFiles(patchedFilesFolder, prepared);
    for (const std::string& file : prepared) FlushToDisk(file);
    std::set<std::string> touchedFolders;
    for (const std::string& file : prepared) {
        const std::string destination = DestinationOf(file);
        MoveWithRetry(file, destination);
        touchedFolders.insert(GetParentDirectory(destination));
    }
    // The moves must be durable before the caller records the new version.
    for (const std::string& folder : touchedFolders) SyncFolder(folder);
}

// The write-ahead gate. Normally each action is recorded before it is
// carried out. When resuming, actions before the recorded one were done
// before the interruption and are skipped; the recorded one is carried out
// again. An action is the recorded one only when both its ordinal and its
// path agree: a path alone can stand for two actions (a folder deleted and
// then created anew), and repeating the deletion after the moves had begun
// would throw away files already moved into it.
bool PatchApplier::ShouldApply(const std::string& path) {
    if (!progressFile->resuming) {
        progressFile->SetActionIndex(actionCounter);
        progressFile->SetFile(path);
        progressFile->WriteRecord();
        ++actionCounter;
        return true;
    }
    const int32_t recorded = progressFile->GetActionIndex();
    const bool isRecorded = recorded == -1 || (recorded == actionCounter && path == progressFile->GetFile());
    // Counting the repeated action too keeps later ordinals true.
    ++actionCounter;
    if (!isRecorded) return false;
    progressFile->resuming = false;
    return true;
}

std::string PatchApplier::DestinationOf(const std::string& preparedFile) const {
    // Every collected file lies below the patched-files folder; only that
    // leading part is exchanged for the installation folder.
    if (preparedFile.compare(0, patchedFilesFolder.size(), patchedFilesFolder) != 0) return preparedFile;
    return PathJoin(installationFolder, preparedFile.substr(patchedFilesFolder.size()));
}

void PatchApplier::MoveWithRetry(const std::string& source, const std::string& destination) const {
    // A prepared file's folder normally exists by now (a "new" folder item,
    // or an earlier file); when a description forgot it, make it rather
    // than ask the player to fix what they cannot.
    const std::string folder = GetParentDirectory(destination);
    if (!folder.empty() && !FileExists(folder)) MakeDirectories(folder);
    while (!MoveFileReplacing(source, destination)) {
        if (retryQuestion == nullptr || !retryQuestion->AskRetryMove(source, destination)) {
            throw Exception("Failed to move file from " + source + " to " + destination, ErrorCode::StepFailed);
        }
    }
}
