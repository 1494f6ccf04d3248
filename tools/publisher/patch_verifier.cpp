#include "tools/publisher/patch_verifier.h"

#include <filesystem>
#include <list>
#include <random>
#include <set>
#include <system_error>

#include "net/http_downloader.h"
#include "patch/exception.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/paths.h"
#include "patch/relative_path.h"
#include "tools/publisher/tree_listing.h"

namespace {

// A new folder of its own under the system's temporary folder, removed
// with everything in it at the end.
class ScratchFolder {
public:
    ScratchFolder() {
        std::random_device random;
        for (int attempt = 0; attempt < 100; ++attempt) {
            const std::string candidate = PathJoin(GetTempDirectory(), "ironvale-verify-" + std::to_string(random()));
            std::error_code error;
            if (std::filesystem::create_directory(ToFileSystemPath(candidate), error)) {
                path = candidate;
                return;
            }
        }
        throw Exception("Cannot create a temporary folder in " + GetTempDirectory());
    }
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;
    ~ScratchFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(ToFileSystemPath(path), ignored);
    }
    std::string path;
};

// The archives the description names, in the order the updater fetches
// them: those of diff items first, then those of new items, each once.
std::list<DownloadEntry> DownloadList(PatchInfoFile& info, const std::string& patchDir,
                                      const std::string& patchFolder) {
    std::vector<std::string> names;
    std::set<std::string> seen;
    std::string path;
    std::string archive;
    info.ResetIterators();
    while (info.NextDiffFile(path, archive)) {
        if (seen.insert(archive).second) names.push_back(archive);
    }
    while (info.NextNewFile(path, archive)) {
        if (seen.insert(archive).second) names.push_back(archive);
    }
    std::list<DownloadEntry> list;
    for (const std::string& name : names) {
        if (!IsContainedRelativePath(name)) throw Exception("Unsafe archive name in patch description: " + name);
        const auto absolute = std::filesystem::absolute(ToFileSystemPath(PathJoin(patchDir, name)));
        list.emplace_back("file://" + NarrowEntryName(absolute, patchDir), PathJoin(patchFolder, name));
    }
    return list;
}

void ApplyPatchTo(const std::string& patchDir, const std::string& installDir) {
    PatchInfoFile info;
    info.Load(PathJoin(patchDir, "patchinfo.xml"));
    const std::string patchFolder = PathJoin(installDir, "tempPatch");
    const std::string patchedFolder = PathJoin(patchFolder, "patched");
    if (!MakeDirectories(patchFolder)) throw Exception("Cannot create " + patchFolder);
    const std::list<DownloadEntry> list = DownloadList(info, patchDir, patchFolder);
    HttpDownloader downloader;
    if (!list.empty()) downloader.Start(list, false);
    PatchProgressFile progress;
    progress.SetDirectory(installDir);
    PatchApplier applier;
    applier.Init(&info, &progress, installDir, patchedFolder, patchFolder, nullptr,
                 list.empty() ? nullptr : &downloader);
    applier.PreparePatch();
    progress.SetPatchPath(patchFolder);
    progress.SetPatchedFilesPath(patchedFolder);
    progress.SetPatchUri(patchDir);
    progress.SetVersion("verify");
    progress.resuming = false;
    progress.SetActionIndex(-1);
    progress.SetFile("");
    progress.WriteRecord();
    applier.ApplyPatch();
}

}  // namespace

std::vector<std::string> CompareTrees(const std::string& actualDir, const std::string& expectedDir,
                                      const std::vector<std::string>& ignored) {
    const TreeListing actual = ListTree(actualDir, std::set<std::string>(ignored.begin(), ignored.end()));
    const TreeListing expected = ListTree(expectedDir);
    std::vector<std::string> differences;
    for (const std::string& folder : expected.directories) {
        if (actual.directories.count(folder) == 0) differences.push_back("missing folder: " + folder);
    }
    for (const std::string& folder : actual.directories) {
        if (expected.directories.count(folder) == 0) differences.push_back("unexpected folder: " + folder);
    }
    for (const auto& file : expected.files) {
        if (actual.files.count(file.first) == 0) {
            differences.push_back("missing file: " + file.first);
        } else if (!SameFileContent(PathJoin(actualDir, file.first), PathJoin(expectedDir, file.first))) {
            differences.push_back("different content: " + file.first);
        }
    }
    for (const auto& file : actual.files) {
        if (expected.files.count(file.first) == 0) differences.push_back("unexpected file: " + file.first);
    }
    return differences;
}

std::vector<std::string> VerifyPatch(const std::string& patchDir, const std::string& oldDir,
                                     const std::string& newDir) {
    ListTree(oldDir);  // a clear error for an unreadable tree before anything is copied
    ScratchFolder scratch;
    const std::string installDir = PathJoin(scratch.path, "install");
    std::error_code error;
    std::filesystem::copy(ToFileSystemPath(oldDir), ToFileSystemPath(installDir),
                          std::filesystem::copy_options::recursive, error);
    if (error) throw Exception("Cannot copy " + oldDir + " to " + installDir + ": " + error.message());
    ApplyPatchTo(patchDir, installDir);
    return CompareTrees(installDir, newDir, {"tempPatch", "PPF.xml", "_PPF.xml"});
}
