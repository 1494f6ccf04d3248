#include "patch/patch_applier.h"

#include <algorithm>
#include <condition_variable>
#include <deque>
#include <exception>
#include <mutex>
#include <thread>

#include "base/archive_source.h"
#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/item_path.h"
#include "base/log.h"
#include "base/memory_budget.h"
#include "base/path_kind.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/status_interfaces.h"
#include "base/string_helpers.h"
#include "patch/checksum.h"
#include "patch/patch_archive.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/prepared_list.h"
#include "patch/vcdiff_decoder.h"

namespace {

const char* const kLogSource = "PatchApplier";

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

size_t DefaultStageOneWorkers() { return std::max(1u, std::thread::hardware_concurrency()); }

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

void PatchApplier::RequireArchiveName(const std::string& name) const {
    if (!IsUsableArchiveName(name)) throw Exception("Unsafe path in patch description: \"" + name + "\"");
}

void PatchApplier::RequireSafe(const std::string& path, const std::vector<std::string>& ownNames) const {
    if (!IsSafeItemPath(path, ownNames)) throw Exception("Unsafe path in patch description: \"" + path + "\"");
}

// An item of the installation is also checked by what it names on the disk:
// an 8.3 alias (TEMP~MPE) reaches the program's own names by another
// spelling, and a link on the way would carry a write, move or delete out
// of the installation.
void PatchApplier::RequireInside(const std::string& item, const std::vector<std::string>& ownNames,
                                 std::set<std::string>& linkFreeFolders) const {
    RequireSafe(item, ownNames);
    const std::string& root = batch.installationFolder;
    // Only a name that is not 8.3 itself gets an alias, and the alias is
    // always written with a tilde: the (slow) lookup is for those alone.
    if (item.find('~') != std::string::npos) {
        const std::string resolved = PathBelow(LongPathName(PathJoin(root, item)), LongPathName(root));
        if (!resolved.empty()) RequireSafe(resolved, ownNames);
    }
    // Each folder on the way is looked at once per check, however many
    // items lie in it.
    for (size_t end = item.find_first_of("/\\"); end != std::string::npos; end = item.find_first_of("/\\", end + 1)) {
        const std::string folder = PathJoin(root, item.substr(0, end));
        if (linkFreeFolders.count(folder) != 0) continue;
        if (KindOf(folder) == PathKind::Link) {
            throw Exception("Path in patch description passes through the link " + folder + ": \"" + item + "\"");
        }
        linkFreeFolders.insert(folder);
    }
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
    // The work folders are written and emptied: neither may be a link, nor
    // lie behind one.
    for (const std::string& folder : {batch.patchFolder, batch.patchedFilesFolder}) {
        const std::string relative = PathBelow(folder, batch.installationFolder);
        if (!relative.empty() && !FirstLinkBelow(batch.installationFolder, relative, true).empty()) {
            throw Exception("The work folder " + folder + " is a link or lies behind one.");
        }
    }
    patchInfo.ResetIterators();
    std::set<std::string> linkFree;
    std::string path;
    std::string archive;
    while (patchInfo.NextDiffFile(path, archive)) {
        RequireInside(path, ownNames, linkFree);
        RequireArchiveName(archive);
    }
    while (patchInfo.NextNewFile(path, archive)) {
        RequireInside(path, ownNames, linkFree);
        RequireArchiveName(archive);
    }
    while (patchInfo.NextDeletedFile(path)) RequireInside(path, ownNames, linkFree);
    while (patchInfo.NextDeletedDirectory(path)) RequireInside(path, ownNames, linkFree);
    while (patchInfo.NextNewDirectory(path)) RequireInside(path, ownNames, linkFree);
    patchInfo.ResetIterators();
}

void PatchApplier::PreparePatch(IArchiveSource& archives) {
    LogEntry(LogLevel::Trace, kLogSource, 55).Stream() << "PreparePatch Start";
    CheckItemPaths();
    const std::vector<PreparationJob> jobs = JobsByArchive();
    const size_t workers = std::min<size_t>(services.workers, jobs.size());
    if (workers <= 1) {
        PrepareInOrder(archives);
    } else {
        PrepareOnWorkers(archives, jobs, workers);
    }
    // A cancel during the last extraction must not pass for a finished
    // stage: stage two would move a cut-off file in.
    CheckCancel();
    WritePreparedList(batch.patchFolder, batch.patchedFilesFolder, PreparedItems());
    MakePreparedFilesDurable();
}

// One after the other in the description's order, each file as soon as its
// archive has arrived.
void PatchApplier::PrepareInOrder(IArchiveSource& archives) {
    LogEntry(LogLevel::Trace, kLogSource, 66).Stream() << "Applying diff files";
    std::string path;
    std::string archive;
    while (patchInfo.NextDiffFile(path, archive)) {
        CheckCancel();
        Advance(path);
        WaitForArchive(archives, archive);
        PrepareDiffFile(path, archive, kDeltaFileName, services.cancel, nullptr);
    }
    LogEntry(LogLevel::Trace, kLogSource, 132).Stream() << "Adding new files";
    while (patchInfo.NextNewFile(path, archive)) {
        CheckCancel();
        Advance(path);
        WaitForArchive(archives, archive);
        PrepareNewFile(path, archive, services.cancel, nullptr);
    }
}

// The items of each archive, the archives in the order they are fetched
// (the order of their first item); empty when a path is prepared twice,
// where only the description's order says which one stays.
std::vector<PatchApplier::PreparationJob> PatchApplier::JobsByArchive() {
    std::vector<PreparationJob> jobs;
    std::map<std::string, size_t> jobOf;
    std::set<std::string> paths;
    bool twice = false;
    const auto add = [&](const std::string& path, const std::string& archive, bool delta) {
        twice = twice || !paths.insert(path).second;
        const auto found = jobOf.emplace(archive, jobs.size());
        if (found.second) jobs.push_back({archive, {}});
        jobs[found.first->second].items.emplace_back(path, delta);
    };
    std::string path;
    std::string archive;
    patchInfo.ResetIterators();
    while (patchInfo.NextDiffFile(path, archive)) add(path, archive, true);
    while (patchInfo.NextNewFile(path, archive)) add(path, archive, false);
    patchInfo.ResetIterators();
    return twice ? std::vector<PreparationJob>() : jobs;
}

// Each arrived archive's files on whichever worker is free, the archives
// handed out as they arrive, memory held within the budget. The first
// failure (or the player's cancel) stops every worker and any wait for an
// archive, and is what the stage ends with.
void PatchApplier::PrepareOnWorkers(IArchiveSource& archives, const std::vector<PreparationJob>& jobs, size_t workers) {
    LogEntry(LogLevel::Trace, kLogSource, 66).Stream() << "Preparing files on " << workers << " workers";
    CancellationToken stop(services.cancel);
    MemoryBudget budget(services.memoryBudget);
    std::mutex mutex;
    std::condition_variable changed;
    std::deque<const PreparationJob*> arrived;
    bool allHandedOut = false;
    std::exception_ptr failure;
    const auto fail = [&] {
        {
            std::lock_guard<std::mutex> lock(mutex);
            if (!failure) failure = std::current_exception();
        }
        stop.Cancel();
        archives.Abandon();
        changed.notify_all();
    };
    std::vector<std::thread> threads;
    for (size_t worker = 0; worker < workers; ++worker) {
        // Each worker unpacks its deltas into a file of its own.
        const std::string deltaName = worker == 0 ? kDeltaFileName : kDeltaFileName + ("." + std::to_string(worker));
        threads.emplace_back([&, deltaName] {
            for (;;) {
                const PreparationJob* job = nullptr;
                {
                    std::unique_lock<std::mutex> lock(mutex);
                    changed.wait(lock, [&] { return !arrived.empty() || allHandedOut || stop.IsCancelled(); });
                    if (arrived.empty() || stop.IsCancelled()) return;
                    job = arrived.front();
                    arrived.pop_front();
                }
                try {
                    for (const auto& [path, delta] : job->items) {
                        stop.ThrowIfCancelled("");
                        Advance(path);
                        if (delta) {
                            PrepareDiffFile(path, job->archive, deltaName, &stop, &budget);
                        } else {
                            PrepareNewFile(path, job->archive, &stop, &budget);
                        }
                    }
                } catch (...) {
                    fail();
                    return;
                }
            }
        });
    }
    for (const PreparationJob& job : jobs) {
        try {
            WaitForArchive(archives, job.archive);
        } catch (...) {
            fail();
            break;
        }
        if (stop.IsCancelled()) break;
        {
            std::lock_guard<std::mutex> lock(mutex);
            arrived.push_back(&job);
        }
        changed.notify_one();
    }
    {
        std::lock_guard<std::mutex> lock(mutex);
        allHandedOut = true;
    }
    changed.notify_all();
    for (std::thread& thread : threads) thread.join();
    if (failure) std::rethrow_exception(failure);
}

// The progress of the batch goes up one file at a time, whichever worker
// reports it.
void PatchApplier::Advance(const std::string& path) {
    std::lock_guard<std::mutex> lock(progressMutex);
    ++filesDone;
    ReportProgress(path);
}

void PatchApplier::PrepareDiffFile(const std::string& path, const std::string& archive, const std::string& deltaName,
                                   const CancellationToken* cancel, MemoryBudget* budget) {
    const std::string deltaPath = PathJoin(batch.patchFolder, deltaName);
    PatchArchive(PathJoin(batch.patchFolder, archive)).DecodeFile(path, deltaPath, cancel, budget);
    if (IsCancelled(cancel)) throw Exception("", ErrorCode::UserCancelled);
    const std::string folder = PathJoin(batch.patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder) && !MakeDirectories(folder)) {
        throw Exception("Failed to create " + folder, ErrorCode::StepFailed);
    }

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
        const MemoryBudget::Reservation windows(budget, VcdiffDecoder::MemoryNeed(&source, &delta));
        VcdiffDecoder::Decode(&source, &delta, &target, cancel);
        target.Flush();
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::UserCancelled) throw;
        throw Exception(
            "Failed to apply delta file " + deltaPath + " on " + sourcePath + ". Source message: " + error.message,
            ErrorCode::DeltaFailed);
    }
    DiscardFile(deltaPath);
}

void PatchApplier::PrepareNewFile(const std::string& path, const std::string& archive, const CancellationToken* cancel,
                                  MemoryBudget* budget) {
    const std::string folder = PathJoin(batch.patchedFilesFolder, GetParentDirectory(path));
    if (!FileExists(folder) && !MakeDirectories(folder)) {
        throw Exception("Failed to create " + folder, ErrorCode::StepFailed);
    }
    const std::string target = PathJoin(batch.patchedFilesFolder, path);
    PatchArchive(PathJoin(batch.patchFolder, archive)).DecodeFile(path, target, cancel, budget);
    FlushToDisk(target);
}

// Stage two starts to depend on the prepared files with its first record:
// a power cut after it must not find them empty or missing. The files'
// data is flushed as each is written; here their names follow, every
// folder from the installation down to each prepared file.
void PatchApplier::MakePreparedFilesDurable() {
    std::vector<std::string> prepared;
    for (const std::string& item : PreparedItems()) prepared.push_back(PathJoin(batch.patchedFilesFolder, item));
    prepared.push_back(PathJoin(batch.patchFolder, kPreparedListName));
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

// The files stage one prepares: every "diff" and "new" item, each path
// once, in the description's order.
std::vector<std::string> PatchApplier::PreparedItems() {
    std::vector<std::string> items;
    std::set<std::string> seen;
    std::string path;
    std::string archive;
    patchInfo.ResetIterators();
    while (patchInfo.NextDiffFile(path, archive)) {
        if (seen.insert(path).second) items.push_back(path);
    }
    while (patchInfo.NextNewFile(path, archive)) {
        if (seen.insert(path).second) items.push_back(path);
    }
    patchInfo.ResetIterators();
    return items;
}

// Every prepared file must be there, as large as stage one made it, before
// the installation starts to depend on them; once the moves have begun, a
// file may already stand at its destination instead, which its checksum
// tells from the old file.
void PatchApplier::CheckPreparedFiles(const std::optional<ResumePoint>& recordedAction) {
    // The record that marks the start of the moves names no path.
    const bool movesBegun = recordedAction && recordedAction->actionIndex >= 0 && recordedAction->file.empty();
    const std::map<std::string, PreparedFile> listed = ReadPreparedList(batch.patchFolder);
    for (const std::string& item : PreparedItems()) {
        const auto found = listed.find(item);
        if (found != listed.end()) {
            const PreparedFile& file = found->second;
            if (FileSizeOf(PathJoin(batch.patchedFilesFolder, item)) == file.size) continue;
            const std::string destination = PathJoin(batch.installationFolder, item);
            if (movesBegun && FileSizeOf(destination) == file.size && ChecksumOfFile(destination) == file.checksum) {
                continue;
            }
        }
        if (movesBegun) {
            throw Exception("The prepared file " + item + " was lost after the moves had begun.",
                            ErrorCode::ReinstallRequired);
        }
        throw Exception("The prepared file " + item + " is missing or not as stage one made it.",
                        ErrorCode::PreparedFilesMissing);
    }
}

// Each action is on the disk before the next one is recorded: a record
// that outlived a power cut must never name an action after one the cut
// undid, or the resumed run would skip the undone one. Nothing is skipped:
// what cannot be deleted, made or moved gets the retry question, and a
// Cancel ends the stage unfinished, resumable.
void PatchApplier::ApplyPatch(const std::optional<ResumePoint>& recordedAction) {
    LogEntry(LogLevel::Trace, kLogSource, 161).Stream() << "ApplyPatch Start";
    resumeAt = recordedAction;
    std::string path;
    while (patchInfo.NextDeletedFile(path)) {
        if (ShouldApply(path)) Delete(PathJoin(batch.installationFolder, path), PathKind::File);
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo.NextDeletedDirectory(path)) {
        if (ShouldApply(path)) Delete(PathJoin(batch.installationFolder, path), PathKind::Directory);
        ++filesDone;
        ReportProgress(path);
    }
    while (patchInfo.NextNewDirectory(path)) {
        const std::string target = PathJoin(batch.installationFolder, path);
        if (ShouldApply(path)) {
            ClearWay(target, PathKind::Directory);
            if (!MakeDirectories(target)) throw Exception("Failed to create " + target, ErrorCode::StepFailed);
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

    for (const std::string& item : PreparedItems()) {
        const std::string source = PathJoin(batch.patchedFilesFolder, item);
        // Moved before an interruption: CheckPreparedFiles found it there.
        if (KindOf(source) != PathKind::File) continue;
        const std::string destination = PathJoin(batch.installationFolder, item);
        ClearWay(destination, PathKind::File);
        MoveWithRetry(source, destination);
        NoteChanged(destination);
    }
    // Everything must be durable before the caller records the new version.
    for (const std::string& folder : changedFolders) SyncFolder(folder);
}

// Deletes what an item deletes when it is there as that kind (a link in
// its place goes itself, never what it leads to).
void PatchApplier::Delete(const std::string& target, PathKind kind) {
    const PathKind found = KindOf(target);
    if (found == PathKind::Missing || (found != kind && found != PathKind::Link)) return;
    RemoveWithRetry(target);
}

void PatchApplier::RemoveWithRetry(const std::string& target) {
    for (;;) {
        const PathKind found = KindOf(target);
        if (found == PathKind::Missing) break;
        ClearReadOnly(target);
        if (found == PathKind::Directory ? DeleteDirectory(target, true) : RemoveFile(target)) break;
        if (services.retryQuestion == nullptr || !services.retryQuestion->AskRetryDelete(target)) {
            throw Exception("Failed to delete " + target, ErrorCode::StepFailed);
        }
    }
    SyncFolder(GetParentDirectory(target));
}

// The build installs over any tree the game can have had: a file (or a
// link) standing where a folder is needed, or a folder where a file is, is
// removed first, inside the installation only. Everything else stays.
void PatchApplier::ClearWay(const std::string& target, PathKind needed) {
    const std::string relative = PathBelow(target, batch.installationFolder);
    std::string path = batch.installationFolder;
    for (size_t start = 0;;) {
        const size_t end = relative.find(kPathSeparator, start);
        path = PathJoin(path, relative.substr(start, end == std::string::npos ? std::string::npos : end - start));
        const PathKind found = KindOf(path);
        if (end == std::string::npos) {
            if (found == PathKind::Link || (found != PathKind::Missing && found != needed)) RemoveWithRetry(path);
            if (found == PathKind::File) ClearReadOnly(path);
            return;
        }
        if (found == PathKind::File || found == PathKind::Link) RemoveWithRetry(path);
        start = end + 1;
    }
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

void PatchApplier::MoveWithRetry(const std::string& source, const std::string& destination) {
    // A prepared file's folder normally exists by now (a "new" folder item,
    // or an earlier file); when a description forgot it, make it rather
    // than ask the player to fix what they cannot.
    const std::string folder = GetParentDirectory(destination);
    if (!folder.empty() && !MakeDirectories(folder))
        throw Exception("Failed to create " + folder, ErrorCode::StepFailed);
    while (!MoveFileReplacing(source, destination)) {
        if (services.retryQuestion == nullptr || !services.retryQuestion->AskRetryMove(source, destination)) {
            throw Exception("Failed to move file from " + source + " to " + destination, ErrorCode::StepFailed);
        }
    }
}
