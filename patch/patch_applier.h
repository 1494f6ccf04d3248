#pragma once

#include <atomic>
#include <cstdint>
#include <set>
#include <string>
#include <vector>

class IArchiveSource;
class IStatusView;
class PatchInfoFile;
class PatchProgressFile;

// Asked when a prepared file cannot be moved into the installation (the
// game or another program holds the old file open): true to try again.
// The program answers with a box in the player's language.
class IMoveRetryQuestion {
public:
    virtual bool AskRetryMove(const std::string& source, const std::string& destination) = 0;

protected:
    IMoveRetryQuestion() = default;
    IMoveRetryQuestion(const IMoveRetryQuestion&) = default;
    IMoveRetryQuestion& operator=(const IMoveRetryQuestion&) = default;
    ~IMoveRetryQuestion() = default;
};

// Carries out one patch in two stages, so the installation is touched only
// once everything it needs is on disk. PreparePatch builds every patched
// and new file in the patched-files folder while the archives arrive;
// ApplyPatch deletes, creates folders and moves the prepared files in,
// recording each deletion and folder action beforehand so that a run cut
// short at any moment is finished by the next one.
class PatchApplier {
public:
    PatchApplier() = default;
    PatchApplier(const PatchApplier&) = delete;
    PatchApplier& operator=(const PatchApplier&) = delete;
    virtual ~PatchApplier() = default;

    // Keeps the arguments (none owned), clears a cancel request and counts
    // the batch's items. The archive source may be null for a resumed batch.
    void Init(PatchInfoFile* patchInfo, PatchProgressFile* progressFile, const std::string& installationFolder,
              const std::string& patchedFilesFolder, const std::string& patchFolder, IStatusView* statusView,
              IArchiveSource* archives);
    // Who is asked when a move fails; without one (null) the first failed
    // move ends stage two. Not owned; kept across Init.
    void SetRetryQuestion(IMoveRetryQuestion* question) { retryQuestion = question; }
    // Names in the installation (relative) that belong to the program, such
    // as its installation record: no item may name them or lie inside them.
    // The work folders and the progress record are protected anyway. Kept
    // across Init.
    void ProtectNames(const std::vector<std::string>& names) { protectedNames = names; }

    // Stage one. Throws Exception on every failure; the installation is
    // not changed. When it returns, every prepared file is on the disk.
    void PreparePatch();
    // Stage two. Throws Exception when a prepared file cannot be moved and
    // the user gives up, or when an action cannot be recorded. When it
    // returns, every change is on the disk.
    void ApplyPatch();

    // Throws Exception when any name of the batch may not touch the disk.
    // Both stages begin with it; stage two's caller calls it before it
    // writes anything of its own.
    void CheckItemPaths();

    // From the window's thread: stage one stops at its next check.
    void RequestCancel() { cancelRequested = true; }

private:
    void CheckCancel() const;
    void ReportProgress(const std::string& path) const;
    void WaitForArchive(const std::string& archiveName) const;
    bool ShouldApply(const std::string& path);
    void Record(int32_t action, const std::string& path);
    void MoveWithRetry(const std::string& source, const std::string& destination);
    void RequireSafe(const std::string& path, const std::vector<std::string>& ownNames) const;
    void MakePreparedFilesDurable();
    void NoteChanged(const std::string& path);
    void PrepareDiffFile(const std::string& path, const std::string& archive);
    void PrepareNewFile(const std::string& path, const std::string& archive);
    std::string DestinationOf(const std::string& preparedFile) const;

    PatchInfoFile* patchInfo = nullptr;
    PatchProgressFile* progressFile = nullptr;
    std::string installationFolder;
    std::string patchedFilesFolder;
    std::string patchFolder;
    IStatusView* statusView = nullptr;
    IArchiveSource* archives = nullptr;
    IMoveRetryQuestion* retryQuestion = nullptr;
    std::vector<std::string> protectedNames;
    // Folders the moves changed, synced before stage two returns.
    std::set<std::string> changedFolders;
    int32_t filesDone = 0;
    int32_t filesTotal = 0;
    std::atomic<bool> cancelRequested{false};
    int32_t actionCounter = 0;
};
