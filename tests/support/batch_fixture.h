#pragma once

#include <functional>
#include <list>
#include <map>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "base/status_interfaces.h"
#include "net/download_entry.h"
#include "net/http_downloader.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "tests/support/test_files.h"

// A folder tree in memory: files by relative path ("a/b.txt", slashes) with
// their contents, and every folder (also the parents of files).
struct Tree {
    std::map<std::string, std::string> files;
    std::set<std::string> folders;

    // Adds a file and its parent folders.
    Tree& File(const std::string& path, const std::string& content);
    // Adds a folder and its parents.
    Tree& Folder(const std::string& path);
};

void WriteTree(const std::string& root, const Tree& tree);
Tree ReadTree(const std::string& root);
// Every file below root (relative paths); empty for a missing folder.
std::vector<std::string> FilesBelow(const std::string& root);
// Deterministic bytes for a file of the given size.
std::string SeededBytes(size_t size, unsigned seed);

// One item of a patch description.
struct PatchItem {
    std::string list;     // FileChanges or DirectoryChanges
    std::string kind;     // diff, new or delete
    std::string path;     // relative, as written into the description
    std::string archive;  // diff and new only
};

// Writes a patch description holding the items in order.
void WritePatchInfo(const std::string& path, const std::vector<PatchItem>& items);

// Writes the VCDIFF delta that rebuilds newPath from oldPath.
void MakeDelta(const std::string& oldPath, const std::string& newPath, const std::string& deltaPath);

// Chooses the archive of a diff or new file from its relative path.
using ArchiveChooser = std::function<std::string(const std::string& path)>;

// A patch made in the test from two trees, laid out as a run of the updater
// finds it: the installation (a copy of the old tree), the archives and
// "patchinfo.xml" in a served folder, and empty patch and patched-files
// folders. Item paths in the description use backslashes, as real patches do.
class TestBatch {
public:
    TestBatch(const Tree& installed, const Tree& target, ArchiveChooser chooser);
    TestBatch(const Tree& installed, const Tree& target);

    std::string Installation() const { return root / "install"; }
    std::string PatchedFiles() const { return root / "patched"; }
    std::string PatchFolder() const { return root / "patch"; }
    std::string Served() const { return root / "served"; }
    // Where the progress record ("PPF.xml") is kept, apart from the tree.
    std::string RecordFolder() const { return root / "record"; }
    std::string InfoPath() const;

    const std::vector<PatchItem>& Items() const { return items; }
    // Archive names in the order of their first use by the items.
    const std::vector<std::string>& Archives() const { return archives; }
    // The archives as "file://" locations into the patch folder.
    std::list<DownloadEntry> FileDownloads() const;
    // Rewrites the description (e.g. with hostile items).
    void ReplaceItems(const std::vector<PatchItem>& replacement);

    // Both stages as the updater runs them (BatchRun), the archives
    // fetched from their file:// locations; view may be null. Throws what
    // the applier throws.
    void Apply(IStatusView* view = nullptr);

private:
    TempFolder root;
    std::vector<PatchItem> items;
    std::vector<std::string> archives;
};

// One run of the applier over a batch, its parts open to the test.
class BatchRun {
public:
    // Loads the description and initialises the applier with the
    // downloader; view (may be null) gets the applier's reports.
    explicit BatchRun(const TestBatch& batch, IStatusView* view = nullptr);
    // Starts the downloader on the batch's file:// locations.
    void StartFileDownloads();
    // Stage one; the downloads must have been started.
    void Prepare() { applier.PreparePatch(); }
    // Stage two after the record the updater writes before it.
    void ApplyStageTwo();

    const TestBatch& batch;
    PatchInfoFile info;
    PatchProgressFile progress;
    HttpDownloader downloader;
    PatchApplier applier;
};

// Keeps every applier report, safe to call from any thread.
class ApplyReports final : public IStatusView {
public:
    struct Report {
        std::string fileName;
        int32_t permille;
    };
    void OnApplyProgress(const std::string& fileName, int32_t permille) override;
    void OnFileProgress(const std::string&, uint32_t, uint32_t) override {}
    void OnFileDone(const std::string&) override {}
    std::vector<Report> Reports() const;

private:
    mutable std::mutex mutex;
    std::vector<Report> reports;
};
