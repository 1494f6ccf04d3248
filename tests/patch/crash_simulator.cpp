#include "tests/patch/crash_simulator.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <set>

#include "base/paths.h"

namespace fs = std::filesystem;

namespace {

using Kind = CrashSimulator::Operation::Kind;

std::string ParentOf(const std::string& path) {
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? std::string() : path.substr(0, slash);
}

// The file system as the simulator sees it: every file and folder an
// inode with the bytes the program sees (current) and the bytes on the
// disk (durable); names are kept twice as well, as the program sees them
// and as each folder's last sync left them.
class Model {
public:
    explicit Model(const FolderImage& image) {
        for (const auto& entry : image) {
            const size_t id = NewInode(!entry.second.has_value());
            if (entry.second) inodes[id].current = inodes[id].durable = *entry.second;
            current[entry.first] = durable[entry.first] = id;
        }
    }

    void Apply(const CrashSimulator::Operation& operation) {
        const std::string& path = operation.path;
        switch (operation.kind) {
            case Kind::Created:
            case Kind::Truncated:
                if (current.count(path) == 0) {
                    current[path] = NewInode(false);
                } else if (operation.kind == Kind::Truncated) {
                    inodes[current.at(path)].current.clear();
                }
                break;
            case Kind::Wrote: {
                std::string& bytes = inodes[current.at(path)].current;
                const size_t end = static_cast<size_t>(operation.offset) + operation.data.size();
                if (bytes.size() < end) bytes.resize(end, '\0');
                bytes.replace(static_cast<size_t>(operation.offset), operation.data.size(), operation.data);
                break;
            }
            case Kind::Flushed:
                inodes[current.at(path)].durable = inodes[current.at(path)].current;
                break;
            case Kind::Moved: {
                const size_t id = current.at(path);
                current.erase(path);
                current[operation.target] = id;
                break;
            }
            case Kind::RemovedFile:
                current.erase(path);
                break;
            case Kind::MadeDirectories:
                for (size_t slash = 0; !path.empty() && slash != std::string::npos;) {
                    slash = path.find('/', slash + 1);
                    const std::string folder = path.substr(0, slash);
                    if (current.count(folder) == 0) current[folder] = NewInode(true);
                }
                break;
            case Kind::RemovedDirectory:
                for (auto it = current.begin(); it != current.end();) {
                    const bool below = it->first == path || it->first.rfind(path + "/", 0) == 0;
                    it = below ? current.erase(it) : std::next(it);
                }
                break;
            case Kind::Synced:
                for (auto it = durable.begin(); it != durable.end();) {
                    it = ParentOf(it->first) == path ? durable.erase(it) : std::next(it);
                }
                for (const auto& entry : current) {
                    if (ParentOf(entry.first) == path) durable[entry.first] = entry.second;
                }
                break;
        }
    }

    enum class Data { Durable, Torn, Current };

    FolderImage Image(bool durableNames, Data data, std::mt19937& random) const {
        const std::map<std::string, size_t>& names = durableNames ? durable : current;
        FolderImage image;
        for (const auto& entry : names) {
            if (!Reachable(names, entry.first)) continue;
            const Inode& inode = inodes[entry.second];
            if (inode.folder) {
                image[entry.first] = std::nullopt;
            } else if (data == Data::Current || inode.current == inode.durable) {
                image[entry.first] = data == Data::Durable ? inode.durable : inode.current;
            } else if (data == Data::Durable) {
                image[entry.first] = inode.durable;
            } else {
                image[entry.first] = inode.current.substr(0, random() % (inode.current.size() + 1));
            }
        }
        return image;
    }

private:
    struct Inode {
        bool folder;
        std::string current;
        std::string durable;
    };

    size_t NewInode(bool folder) {
        inodes.push_back(Inode{folder, "", ""});
        return inodes.size() - 1;
    }

    bool Reachable(const std::map<std::string, size_t>& names, const std::string& path) const {
        for (std::string folder = ParentOf(path); !folder.empty(); folder = ParentOf(folder)) {
            const auto found = names.find(folder);
            if (found == names.end() || !inodes[found->second].folder) return false;
        }
        return true;
    }

    std::vector<Inode> inodes;
    std::map<std::string, size_t> current;
    std::map<std::string, size_t> durable;
};

}  // namespace

FolderImage ReadFolderImage(const std::string& root) {
    FolderImage image;
    for (const auto& entry : fs::recursive_directory_iterator(root)) {
        const std::string relative = fs::relative(entry.path(), root).generic_string();
        if (entry.is_directory()) {
            image[relative] = std::nullopt;
        } else {
            std::ifstream in(entry.path(), std::ios::binary);
            image[relative] = std::string(std::istreambuf_iterator<char>(in), {});
        }
    }
    return image;
}

void WriteFolderImage(const std::string& root, const FolderImage& image) {
    fs::remove_all(root);
    fs::create_directories(root);
    for (const auto& entry : image) {
        const fs::path path = fs::path(root) / entry.first;
        if (!entry.second) {
            fs::create_directories(path);
        } else {
            fs::create_directories(path.parent_path());
            std::ofstream(path, std::ios::binary) << *entry.second;
        }
    }
}

CrashSimulator::CrashSimulator(const std::string& folder) : root(folder), initial(ReadFolderImage(folder)) {}

CrashSimulator::~CrashSimulator() { StopRecording(); }

void CrashSimulator::StartRecording() { SetFileJournal(this); }

void CrashSimulator::StopRecording() {
    if (GetFileJournal() == this) SetFileJournal(nullptr);
}

std::vector<FolderImage> CrashSimulator::CrashStates(size_t k, uint32_t seed) const {
    Model model(initial);
    for (size_t i = 0; i < k; ++i) model.Apply(operations[i]);
    std::mt19937 random(seed);
    std::vector<FolderImage> states;
    for (const bool durableNames : {true, false}) {
        for (const auto data : {Model::Data::Durable, Model::Data::Torn, Model::Data::Current}) {
            FolderImage image = model.Image(durableNames, data, random);
            if (std::find(states.begin(), states.end(), image) == states.end()) states.push_back(std::move(image));
        }
    }
    return states;
}

bool CrashSimulator::Relative(const std::string& path, std::string& relative) {
    const std::string prefix = PathJoin(root, "");
    if (path.compare(0, prefix.size(), prefix) != 0) {
        outside.push_back(path);
        return false;
    }
    relative = path.substr(prefix.size());
    while (!relative.empty() && relative.back() == '/') relative.pop_back();
    return true;
}

void CrashSimulator::Add(Operation operation) {
    std::lock_guard<std::mutex> lock(mutex);
    if (!Relative(operation.path, operation.path)) return;
    if (operation.kind == Kind::Moved && !Relative(operation.target, operation.target)) return;
    operations.push_back(std::move(operation));
}

void CrashSimulator::Created(const std::string& path, bool truncated) {
    Add({truncated ? Kind::Truncated : Kind::Created, path, "", 0, ""});
}

void CrashSimulator::Wrote(const std::string& path, int64_t offset, const void* data, uint32_t size) {
    Add({Kind::Wrote, path, "", offset, std::string(static_cast<const char*>(data), size)});
}

void CrashSimulator::Flushed(const std::string& path) { Add({Kind::Flushed, path, "", 0, ""}); }

void CrashSimulator::Moved(const std::string& from, const std::string& to) { Add({Kind::Moved, from, to, 0, ""}); }

void CrashSimulator::RemovedFile(const std::string& path) { Add({Kind::RemovedFile, path, "", 0, ""}); }

void CrashSimulator::MadeDirectories(const std::string& path) { Add({Kind::MadeDirectories, path, "", 0, ""}); }

void CrashSimulator::RemovedDirectory(const std::string& path) { Add({Kind::RemovedDirectory, path, "", 0, ""}); }

void CrashSimulator::SyncedFolder(const std::string& path) {
    // The root itself is synced as the empty relative path.
    Add({Kind::Synced, path == root ? PathJoin(root, "") : path, "", 0, ""});
}
