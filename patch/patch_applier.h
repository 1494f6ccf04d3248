#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "base/path_kind.h"
#include "patch/patch_batch.h"

class CancellationToken;
class IArchiveSource;
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

// The files the stages keep in a batch's patch folder besides the
// archives: the delta being applied, and the list of what stage one
// prepared. No archive may take their names, nor the description's, nor
// the downloader's records folder.
extern const char* const kDeltaFileName;
extern const char* const kPreparedListName;
const std::vector<std::string>& WorkFileNames();

// Who the stages talk to while they work; none is owned, each may be null.
struct StageServices {
    IStatusView* statusView = nullptr;
    // Without one, the first failed move ends stage two.
    IRetryQuestion* retryQuestion = nullptr;
    // Stage one stops at its next check once it is cancelled.
    const CancellationToken* cancel = nullptr;
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
    void RequireInside(const std::string& item, const std::vector<std::string>& ownNames,
                       std::set<std::string>& linkFreeFolders) const;
    std::vector<std::string> PreparedItems();
    void WritePreparedList();
    std::map<std::string, int64_t> ReadPreparedList() const;
    void MakePreparedFilesDurable();
    void NoteChanged(const std::string& path);
    void PrepareDiffFile(IArchiveSource& archives, const std::string& path, const std::string& archive);
    void PrepareNewFile(IArchiveSource& archives, const std::string& path, const std::string& archive);

    const PatchBatch batch;
    PatchInfoFile& patchInfo;
    PatchProgressFile& progressFile;
    const StageServices services;
    // The recorded action a resumed stage two has yet to reach.
    std::optional<ResumePoint> resumeAt;
    // Folders the moves changed, synced before stage two returns.
    std::set<std::string> changedFolders;
    int32_t filesDone = 0;
    int32_t filesTotal = 0;
    int32_t actionCounter = 0;
};
