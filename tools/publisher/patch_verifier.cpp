#include "tools/publisher/patch_verifier.h"

#include <filesystem>
#include <random>
#include <system_error>

#include "base/exception.h"
#include "base/paths.h"
#include "tools/publisher/patch_application.h"
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

}  // namespace

std::vector<std::string> CompareTrees(const std::string& actualDir, const std::string& expectedDir) {
    const TreeListing actual = ListTree(actualDir);
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
    ApplyPatchFolder(patchDir, installDir);
    return CompareTrees(installDir, newDir);
}
