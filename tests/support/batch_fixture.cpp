#include "tests/support/batch_fixture.h"

#include <algorithm>
#include <filesystem>
#include <memory>
#include <ostream>
#include <random>
#include <sstream>
#include <stdexcept>

#include "base/atomic_file.h"
#include "base/paths.h"
#include "tools/publisher/archive_writer.h"
#include "tools/publisher/lzma_encoder.h"
#include "tools/publisher/patch_builder.h"

namespace fs = std::filesystem;

namespace {

std::string Parent(const std::string& path) {
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? "" : path.substr(0, slash);
}

std::string Backslashed(std::string path) {
    std::replace(path.begin(), path.end(), '/', '\\');
    return path;
}

// A VCDIFF delta copying the common prefix and adding the rest, as a Windows test program cannot start xdelta3 (whose
// output the round trips cover).
std::string PrefixDelta(const std::string& oldData, const std::string& newData) {
    size_t copied = 0;
    while (copied < oldData.size() && copied < newData.size() && oldData[copied] == newData[copied]) ++copied;
    const std::string added = newData.substr(copied);
    const std::string instructions =
        (copied ? '\x13' + Varint(copied) : "") + (added.empty() ? "" : '\x01' + Varint(added.size()));
    const std::string addresses = copied ? std::string(1, '\0') : "";  // COPY from the source's start
    const std::string window = Varint(newData.size()) + '\0' + Varint(added.size()) + Varint(instructions.size()) +
                               Varint(addresses.size()) + added + instructions + addresses;
    const std::string header("\xD6\xC3\xC4\x00\x00", 5);
    if (newData.empty()) return header;
    return header + (copied ? '\x01' + Varint(copied) + '\0' : std::string(1, '\0')) + Varint(window.size()) + window;
}

// Empty, small, or past the decoders' buffers.
std::string RandomContent(std::mt19937& random) {
    const size_t sizes[] = {0, random() % 3000, random() % 3000, 20000 + random() % 150000};
    const size_t size = sizes[random() % 4];
    return SeededBytes(size, random());
}

std::string Edited(std::string content, std::mt19937& random) {
    const size_t at = random() % (content.size() + 1);
    content.erase(at, random() % 100);
    return content.insert(at, "inserted " + std::to_string(random()));
}

}  // namespace

std::string Varint(size_t value) {
    std::string bytes(1, static_cast<char>(value & 0x7F));
    while (value >>= 7) bytes.insert(bytes.begin(), static_cast<char>(0x80 | (value & 0x7F)));
    return bytes;
}

Tree& Tree::File(const std::string& path, const std::string& content) {
    files[path] = content;
    return Parent(path).empty() ? *this : Folder(Parent(path));
}

Tree& Tree::Folder(const std::string& path) {
    folders.insert(path);
    return Parent(path).empty() ? *this : Folder(Parent(path));
}

Tree TreeOf(const std::string& layout) {
    Tree tree;
    std::istringstream entries(layout);
    for (std::string entry; std::getline(entries, entry, '|');) {
        const size_t equals = entry.find('=');
        if (equals != std::string::npos) tree.File(entry.substr(0, equals), entry.substr(equals + 1));
        if (equals == std::string::npos) tree.Folder(entry.substr(0, entry.size() - 1));
    }
    return tree;
}

void PrintTo(const Tree& tree, std::ostream* out) {  // paths and hashes, not bytes
    for (const std::string& folder : tree.folders) *out << "\n  " << folder << "/";
    for (const auto& file : tree.files) *out << "\n  " << file.first << " " << std::hash<std::string>()(file.second);
}

void WriteTree(const std::string& root, const Tree& tree) {
    fs::create_directories(fs::u8path(root));
    for (const std::string& folder : tree.folders) fs::create_directories(fs::u8path(PathJoin(root, folder)));
    for (const auto& file : tree.files) WriteTextFile(PathJoin(root, file.first), file.second);
}

Tree ReadTree(const std::string& root) {
    Tree tree;
    for (const auto& entry : fs::recursive_directory_iterator(fs::u8path(root))) {
        const std::string relative = entry.path().lexically_relative(fs::u8path(root)).generic_u8string();
        if (entry.is_directory()) tree.folders.insert(relative);
        if (!entry.is_directory()) tree.files[relative] = ReadTextFile(entry.path().u8string());
    }
    return tree;
}

std::string SeededBytes(size_t size, unsigned seed) {
    std::mt19937 random(seed);
    std::string bytes(size, '\0');
    for (char& byte : bytes) byte = static_cast<char>(random() & 0xFF);
    return bytes;
}

Tree RandomTree(unsigned seed) {
    std::mt19937 random(seed);
    Tree tree;
    std::vector<std::string> folders = {""};
    for (int i = 0; i < 20; ++i) {
        const std::string parent = folders[random() % folders.size()];
        const std::string path = (parent.empty() ? "" : parent + "/") + "n" + std::to_string(i);
        const bool folder = random() % 4 == 0;
        if (folder) folders.push_back(path);
        folder ? tree.Folder(path) : tree.File(path, RandomContent(random));
    }
    return tree;
}

Tree NextVersion(const Tree& old, unsigned seed) {
    std::mt19937 random(seed * 7919 + 1);
    Tree next;
    std::set<std::string> removed;  // parents come first, so a removal takes what lies below
    for (const std::string& folder : old.folders) {
        if (removed.count(Parent(folder)) != 0 || random() % 4 == 0) removed.insert(folder);
        if (removed.count(folder) == 0) next.Folder(folder);
    }
    for (const auto& file : old.files) {
        const unsigned choice = removed.count(Parent(file.first)) != 0 ? 0 : random() % 5;
        if (choice == 1) next.File(file.first, file.second);
        if (choice == 2 || choice == 3) next.File(file.first, Edited(file.second, random));
        if (choice == 4) next.File(file.first + "/" + GetFileName(file.first), RandomContent(random));
    }
    for (const std::string& folder : removed) {  // a top folder becomes a file
        if (Parent(folder).empty() && random() % 2 == 0) next.File(folder, RandomContent(random));
    }
    next.File("added/deeper/new", RandomContent(random)).Folder("empty_new/also_empty");
    return next.File("top_new", RandomContent(random));
}

TestBatch::TestBatch(const Tree& installed, const Tree& target, bool published) {
    WriteTree(Installation(), installed);
    WriteTree(PatchedFiles(), Tree());
    WriteTextFile(VersionFile(), "1");
    if (published) {
        WriteTree(root / "new", target);
        const std::string built = BuildPatch({Installation(), root / "new", "2", root / "out", 3000});
        fs::rename(fs::u8path(built), fs::u8path(PatchFolder()));
        fs::rename(fs::u8path(PathJoin(PatchFolder(), "patchinfo.xml")), fs::u8path(root / "patchinfo.xml"));
        for (const char* scratch : {"new", "out"}) fs::remove_all(fs::u8path(root / scratch));
        return;
    }
    WriteTree(PatchFolder(), Tree());
    std::map<std::string, std::unique_ptr<ArchiveWriter>> archives;
    for (const auto& file : target.files) {
        const auto old = installed.files.find(file.first);
        if (old != installed.files.end() && old->second == file.second) continue;
        const std::string path = Backslashed(file.first);
        const std::string archive = "patch_" + file.first.substr(0, file.first.find('/')) + ".dat";
        if (!archives[archive]) archives[archive] = std::make_unique<ArchiveWriter>(PathJoin(PatchFolder(), archive));
        (old == installed.files.end() ? description.newFiles : description.diffFiles).emplace_back(path, archive);
        archives[archive]->AddStoredMember(
            path, EncodeLzma(old == installed.files.end() ? file.second : PrefixDelta(old->second, file.second)));
    }
    for (const auto& file : installed.files) {
        if (target.files.count(file.first) == 0) description.deletedFiles.push_back(Backslashed(file.first));
    }
    // Deepest folders first, so every deletion finds its folder still there.
    for (auto folder = installed.folders.rbegin(); folder != installed.folders.rend(); ++folder) {
        if (target.folders.count(*folder) == 0) description.deletedDirectories.push_back(Backslashed(*folder));
    }
    for (const std::string& folder : target.folders) {
        if (installed.folders.count(folder) == 0) description.newDirectories.push_back(Backslashed(folder));
    }
    WriteInfo();
}

void TestBatch::WriteInfo() const { WritePatchDescription(description, root / "patchinfo.xml"); }

BatchRun::BatchRun(const std::string& root)
    : versionFile(PathJoin(root, "version")),
      work{PathJoin(root, "install"), PathJoin(root, "patch"), PathJoin(root, "patched"), "", "2"} {
    info.Load(PathJoin(root, "patchinfo.xml"));
    progress.SetDirectory(root);
}

PatchStages& BatchRun::Stages() {
    if (!stages) stages.emplace(work, info, progress, StageServices{this, retryQuestion, &cancel, workers});
    return *stages;
}

void BatchRun::StoreVersion(const std::string& version) {
    if (!ReplaceFileAtomically(versionFile, version)) throw std::runtime_error("cannot store the version");
}

void BatchRun::Resume() {
    const InterruptedBatch next = FindInterruptedBatch(ReadTextFile(versionFile), progress);
    if (next.kind == InterruptedBatch::Kind::Reinstall)
        throw std::runtime_error("the next start would reinstall the complete build");
    if (next.kind == InterruptedBatch::Kind::Resume) Apply(next.resumeAt);
}
