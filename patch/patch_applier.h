#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "base/path_kind.h"
#include "patch/patch_batch.h"

class CancellationToken;
class IArchiveSource;
class MemoryBudget;
class IStatusView;
class PatchInfoFile;
class PatchProgressFile;

// Asked when a prepared file cannot be moved into the installation (the
// game or another program holds the old file open): true to try again.
// The program answers with a box in the player's language.
class IRetryQuestion {
public:
    virtual bool AskRetryMove(const std::string& source, const std::string& destination) = 0;
    // The same when a file or folder of the game cannot be deleted.
    virtual bool AskRetryDelete(const std::string& path) = 0;

protected:
    IRetryQuestion() = default;
    IRetryQuestion(const IRetryQuestion&) = default;
    IRetryQuestion& operator=(const IRetryQuestion&) = default;
    ~IRetryQuestion() = default;
};

// The processor's cores: stage one's default number of workers.
size_t DefaultStageOneWorkers();

// Who the stages talk to while they work; none is owned, each may be null.
struct StageServices {
    IStatusView* statusView = nullptr;
    // Without one, the first failed move ends stage two.
    IRetryQuestion* retryQuestion = nullptr;
    // Stage one stops at its next check once it is cancelled.
    const CancellationToken* cancel = nullptr;
    // Stage one prepares the files of different archives on up to this many
    // workers at once (1: one file after the other, in the description's
    // order), holding at most memoryBudget bytes of dictionaries and delta
    // windows between them (a larger single need runs alone).
    size_t workers = DefaultStageOneWorkers();
    uint64_t memoryBudget = 256ull * 1024 * 1024;
};

// Carries out one patch in two stages, so the installation is touched only
// once everything it needs is on disk. PreparePatch builds every patched
// and new file in the patched-files folder while the archives arrive;
// ApplyPatch deletes, creates folders and moves the prepared files in,
// recording each deletion and folder action beforehand so that a run cut
// short at any moment is finished by the next one.
class PatchApplier {
public:
    // Keeps the batch; the description and the progress record are
    // borrowed for the applier's lifetime.
    PatchApplier(const PatchBatch& batch, PatchInfoFile& description, PatchProgressFile& progress,
                 const StageServices& services);
    PatchApplier(const PatchApplier&) = delete;
    PatchApplier& operator=(const PatchApplier&) = delete;
    virtual ~PatchApplier() = default;

    // Stage one, with the archives as archives delivers them (it may still
    // be fetching them). Throws Exception on every failure; the
    // installation is not changed. When it returns, every prepared file is
    // on the disk.
    void PreparePatch(IArchiveSource& archives);
    // Stage two, from the recorded action when resumeAt is given, once
    // CheckItemPaths and CheckPreparedFiles passed. Throws Exception when a
    // prepared file cannot be moved and the user gives up, or when an
    // action cannot be recorded. When it returns, every change is on the
    // disk.
    void ApplyPatch(const std::optional<ResumePoint>& resumeAt);

    // Throws Exception when any name of the batch may not touch the disk.
    // Both stages begin with it; stage two's caller calls it before it
    // writes anything of its own.
    void CheckItemPaths();
    // Before stage two depends on them: every prepared file as large as
    // stage one made it (or, once the moves have begun, already at its
    // destination). Throws PreparedFilesMissing when stage one must run
    // again, ReinstallRequired when files were lost after the moves began.
    void CheckPreparedFiles(const std::optional<ResumePoint>& resumeAt);

private:
    void CheckCancel() const;
    void ReportProgress(const std::string& path) const;
    void WaitForArchive(IArchiveSource& archives, const std::string& archiveName) const;
    bool ShouldApply(const std::string& path);
    void Record(int32_t action, const std::string& path);
    void MoveWithRetry(const std::string& source, const std::string& destination);
    void Delete(const std::string& target, PathKind kind);
    void RemoveWithRetry(const std::string& target);
    void ClearWay(const std::string& target, PathKind needed);
    void RequireSafe(const std::string& path, const std::vector<std::string>& ownNames) const;
    void RequireArchiveName(const std::string& name) const;
    void RequireInside(const std::string& item, const std::vector<std::string>& ownNames,
                       std::set<std::string>& linkFreeFolders) const;
    std::vector<std::string> PreparedItems();
    void MakePreparedFilesDurable();
    void NoteChanged(const std::string& path);
    // An archive and what stage one prepares from it: paths, each with
    // whether it is a delta.
    struct PreparationJob {
        std::string archive;
        std::vector<std::pair<std::string, bool>> items;
    };
    void PrepareInOrder(IArchiveSource& archives);
    std::vector<PreparationJob> JobsByArchive();
    void PrepareOnWorkers(IArchiveSource& archives, const std::vector<PreparationJob>& jobs, size_t workers);
    void Advance(const std::string& path);
    void PrepareDiffFile(const std::string& path, const std::string& archive, const std::string& deltaName,
                         const CancellationToken* cancel, MemoryBudget* budget);
    void PrepareNewFile(const std::string& path, const std::string& archive, const CancellationToken* cancel,
                        MemoryBudget* budget);

    const PatchBatch batch;
    PatchInfoFile& patchInfo;
    PatchProgressFile& progressFile;
    const StageServices services;
    // The recorded action a resumed stage two has yet to reach.
    std::optional<ResumePoint> resumeAt;
    // Folders the moves changed, synced before stage two returns.
    std::set<std::string> changedFolders;
    std::mutex progressMutex;  // stage one's workers report one at a time
    int32_t filesDone = 0;
    int32_t filesTotal = 0;
    int32_t actionCounter = 0;
};
