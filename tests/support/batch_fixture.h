#pragma once

#include <functional>
#include <iosfwd>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "base/archive_source.h"
#include "base/cancellation.h"
#include "base/status_interfaces.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "tests/support/test_files.h"
#include "tools/publisher/patch_description.h"

// Files by relative path ("a/b.txt") with their contents, and every folder.
struct Tree {
    std::map<std::string, std::string> files;
    std::set<std::string> folders;

    Tree& File(const std::string& path, const std::string& content);  // with its parents
    Tree& Folder(const std::string& path);                            // with its parents
    bool operator==(const Tree& other) const { return files == other.files && folders == other.folders; }
};
Tree TreeOf(const std::string& layout);  // "a/b.txt=text|empty/folder/|c.txt="
void PrintTo(const Tree& tree, std::ostream* out);
void WriteTree(const std::string& root, const Tree& tree);
Tree ReadTree(const std::string& root);

std::string SeededBytes(size_t size, unsigned seed);
std::string Varint(size_t value);  // VCDIFF's integer: base 128, most significant digit first
// A seeded game tree, and its next version: files edited, added and removed, folders added and removed, files and
// folders trading places.
Tree RandomTree(unsigned seed);
Tree NextVersion(const Tree& old, unsigned seed);

// A patch made from two trees, laid out as stage one finds it: the old tree installed with version "1", the archives
// (one per top folder or file) and the description; published: those of the publisher's tool (needs xdelta3).
class TestBatch {
public:
    TestBatch(const Tree& installed, const Tree& target, bool published = false);
    std::string Root() const { return root.Path(); }  // also holds the progress record
    std::string Installation() const { return root / "install"; }
    std::string PatchedFiles() const { return root / "patched"; }
    std::string PatchFolder() const { return root / "patch"; }
    std::string VersionFile() const { return root / "version"; }
    void WriteInfo() const;  // after a test changed the description
    PatchDescription description;

private:
    TempFolder root;
};

// One run of the updater over a batch, its parts open to the test: the
// archives are in place (state makes every wait end otherwise), the
// applier's reports are kept and handed to onReport (a cancel, a crash),
// the installed version is kept in the batch's version file.
class BatchRun final : public IArchiveSource, public IStatusView, public IInstallationRecords {
public:
    // The batch a TestBatch laid out below root (perhaps in another process).
    explicit BatchRun(const std::string& root);
    explicit BatchRun(const TestBatch& batch) : BatchRun(batch.Root()) {}
    ArchiveState WaitForArchive(const std::string&) override { return state; }
    void OnApplyProgress(const std::string& fileName, int32_t permille) override {
        reports.emplace_back(fileName, permille);
        if (onReport) onReport(fileName);
    }
    void OnFileProgress(const std::string&, uint32_t, uint32_t) override {}
    void OnFileDone(const std::string&) override {}
    void StoreVersion(const std::string& version) override;
    void RecordInstalledBatch(const PatchBatch&, PatchInfoFile&) override {}
    void Prepare() { Stages().Prepare(*this); }
    void Apply(const std::optional<ResumePoint>& resumeAt = std::nullopt) { Stages().Apply(this, resumeAt); }
    // The next start after an interruption, by the updater's own decision:
    // stage two resumed from its record, or nothing; a reinstall throws.
    void Resume();

    const std::string versionFile;
    PatchBatch work;  // as it is when the run first prepares or applies
    PatchInfoFile info;
    PatchProgressFile progress;
    CancellationToken cancel;
    IRetryQuestion* retryQuestion = nullptr;
    size_t workers = DefaultStageOneWorkers();
    ArchiveState state = ArchiveState::Arrived;
    std::function<void(const std::string& fileName)> onReport;
    std::vector<std::pair<std::string, int32_t>> reports;

private:
    PatchStages& Stages();
    std::optional<PatchStages> stages;
};
