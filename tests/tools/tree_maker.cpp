#include "tests/tools/tree_maker.h"

#include <algorithm>
#include <filesystem>
#include <random>
#include <vector>

#include "base/paths.h"
#include "tests/support/test_files.h"
#include "tools/publisher/delta_maker.h"

namespace fs = std::filesystem;

namespace {

std::string RandomContent(std::mt19937& random) {
    const int kind = random() % 4;
    size_t size = random() % 3000;
    if (kind == 0) size = 0;
    if (kind == 3) size = 20000 + random() % 150000;
    std::string content;
    content.reserve(size);
    const bool text = random() % 2 == 0;
    while (content.size() < size) {
        if (text) {
            content += "line " + std::to_string(random() % 50) + " of the realm\n";
        } else {
            content += static_cast<char>(random());
        }
    }
    content.resize(size);
    return content;
}

std::string Edit(std::string content, std::mt19937& random) {
    const int edits = 1 + random() % 4;
    for (int i = 0; i < edits; ++i) {
        const size_t at = content.empty() ? 0 : random() % content.size();
        switch (random() % 3) {
            case 0:
                content.insert(at, "inserted " + std::to_string(random()));
                break;
            case 1:
                content.erase(at, random() % 100);
                break;
            default:
                if (!content.empty())
                    content[at] = static_cast<char>(content[at] + 1);
                else
                    content = "x";
        }
    }
    return content;
}

std::vector<fs::path> Entries(const fs::path& root, bool folders) {
    std::vector<fs::path> found;
    for (const auto& entry : fs::recursive_directory_iterator(root)) {
        if (entry.is_directory() == folders) found.push_back(entry.path());
    }
    std::sort(found.begin(), found.end());
    return found;
}

}  // namespace

void MakeRandomTree(uint32_t seed, const std::string& root) {
    std::mt19937 random(seed);
    std::vector<std::string> folders = {root};
    fs::create_directories(root);
    const int count = 10 + random() % 15;
    for (int i = 0; i < count; ++i) {
        const std::string& parent = folders[random() % folders.size()];
        if (random() % 4 == 0) {
            const std::string folder = PathJoin(parent, "dir" + std::to_string(i));
            fs::create_directories(folder);
            folders.push_back(folder);
        } else {
            WriteTextFile(PathJoin(parent, "file" + std::to_string(i) + ".dat"), RandomContent(random));
        }
    }
}

void MakeNextVersion(uint32_t seed, const std::string& oldRoot, const std::string& newRoot) {
    std::mt19937 random(seed * 7919 + 1);
    fs::copy(oldRoot, newRoot, fs::copy_options::recursive);
    std::vector<fs::path> files = Entries(newRoot, false);
    bool swapped = false;
    for (const fs::path& file : files) {
        switch (random() % 5) {
            case 0:
                fs::remove(file);
                break;
            case 1:
            case 2:
                WriteTextFile(file.string(), Edit(ReadTextFile(file.string()), random));
                break;
            case 3:
                // A file becomes a folder holding a file of the same name.
                if (!swapped) {
                    fs::remove(file);
                    fs::create_directories(file);
                    WriteTextFile((file / file.filename()).string(), RandomContent(random));
                    swapped = true;
                }
                break;
            default:
                break;
        }
    }
    std::vector<fs::path> folders = Entries(newRoot, true);
    for (const fs::path& folder : folders) {
        if (!fs::exists(folder)) continue;
        if (random() % 4 == 0) {
            fs::remove_all(folder);
            // A folder becomes a file of the same name.
            if (random() % 2 == 0) WriteTextFile(folder.string(), RandomContent(random));
        }
    }
    folders.push_back(newRoot);
    const fs::path parent = folders[random() % folders.size()];
    if (fs::is_directory(parent)) {
        fs::create_directories(parent / "added" / "deeper");
        WriteTextFile((parent / "added" / "deeper" / "new.dat").string(), RandomContent(random));
    }
    fs::create_directories(fs::path(newRoot) / "empty_new" / "also_empty");
    WriteTextFile(PathJoin(newRoot, "top_new.txt"), RandomContent(random));
}

bool CanRunXdelta3() { return IsXdelta3Available(); }
