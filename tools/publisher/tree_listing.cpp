#include "tools/publisher/tree_listing.h"

#include <algorithm>
#include <system_error>
#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/item_path.h"
#include "base/paths.h"
#include "base/record_names.h"

namespace {

// A member name's length is stored in one byte.
constexpr size_t kMaximumPathLength = 255;

// What the updater keeps for itself in an installation: its work folder
// and its records. The updater refuses a patch that names them.
std::vector<std::string> UpdaterOwnNames() {
    std::vector<std::string> names = InstallationRecordNames();
    names.push_back("tempPatch");
    return names;
}

void CheckRelativePath(const std::string& relative, const std::string& name) {
    if (name.find_first_of("\\:") != std::string::npos) {
        throw Exception("A patch cannot carry a name holding a backslash or colon: " + relative);
    }
    if (relative.size() > kMaximumPathLength) {
        throw Exception("A patch cannot carry a path longer than 255 bytes: " + relative);
    }
    if (!IsSafeItemPath(relative, UpdaterOwnNames())) {
        throw Exception("A patch cannot carry this name (the updater would refuse it): " + relative);
    }
}

void Walk(const std::string& root, const std::string& relative, TreeListing& listing) {
    const std::string folder = relative.empty() ? root : PathJoin(root, relative);
    std::error_code error;
    std::filesystem::directory_iterator entries(ToFileSystemPath(folder), error);
    if (error) throw Exception("Cannot list folder " + folder + ": " + error.message());
    std::vector<std::pair<std::string, bool>> found;
    for (const std::filesystem::directory_iterator end; entries != end; entries.increment(error)) {
        if (error) break;
        const std::string name = NarrowEntryName(entries->path().filename(), folder);
        const std::string path = relative.empty() ? name : relative + "\\" + name;
        CheckRelativePath(path, name);
        const auto status = entries->status(error);
        if (error) break;
        if (std::filesystem::is_directory(status)) {
            found.emplace_back(path, true);
        } else if (std::filesystem::is_regular_file(status)) {
            const uint64_t size = entries->file_size(error);
            if (error) break;
            listing.files[path] = size;
        } else {
            throw Exception("Neither a file nor a folder: " + PathJoin(root, path));
        }
    }
    if (error) throw Exception("Cannot list folder " + folder + ": " + error.message());
    for (const auto& directory : found) {
        listing.directories.insert(directory.first);
        Walk(root, directory.first, listing);
    }
}

}  // namespace

TreeListing ListTree(const std::string& root) {
    std::error_code error;
    if (!std::filesystem::is_directory(ToFileSystemPath(root), error)) {
        throw Exception("Not a readable folder: " + root);
    }
    TreeListing listing;
    Walk(root, "", listing);
    return listing;
}

bool SameFileContent(const std::string& first, const std::string& second) {
    FileStream a;
    FileStream b;
    a.Open(first);
    b.Open(second);
    if (a.GetLength() != b.GetLength()) return false;
    std::vector<char> bufferA(1 << 16);
    std::vector<char> bufferB(1 << 16);
    for (;;) {
        const uint32_t readA = a.Read(bufferA.data(), static_cast<uint32_t>(bufferA.size()));
        uint32_t readB = 0;
        while (readB < readA) {
            const uint32_t more = b.Read(bufferB.data() + readB, readA - readB);
            if (more == 0) return false;
            readB += more;
        }
        if (readA == 0) return b.Read(bufferB.data(), 1) == 0;
        if (!std::equal(bufferA.begin(), bufferA.begin() + readA, bufferB.begin())) return false;
    }
}
