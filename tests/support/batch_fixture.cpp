#include "tests/support/batch_fixture.h"

#include <tinyxml.h>

#include <algorithm>
#include <filesystem>
#include <random>
#include <stdexcept>

#include "base/file_stream.h"
#include "base/paths.h"
#include "tools/publisher/archive_writer.h"

namespace fs = std::filesystem;

namespace {

std::string Backslashed(std::string path) {
    std::replace(path.begin(), path.end(), '/', '\\');
    return path;
}

void AddParents(Tree& tree, const std::string& path) {
    for (size_t slash = path.find('/'); slash != std::string::npos; slash = path.find('/', slash + 1)) {
        tree.folders.insert(path.substr(0, slash));
    }
}

}  // namespace

Tree& Tree::File(const std::string& path, const std::string& content) {
    files[path] = content;
    AddParents(*this, path);
    return *this;
}

Tree& Tree::Folder(const std::string& path) {
    folders.insert(path);
    AddParents(*this, path);
    return *this;
}

void WriteTree(const std::string& root, const Tree& tree) {
    fs::create_directories(fs::u8path(root));
    for (const std::string& folder : tree.folders) fs::create_directories(fs::u8path(PathJoin(root, folder)));
    for (const auto& file : tree.files) WriteTextFile(PathJoin(root, file.first), file.second);
}

Tree ReadTree(const std::string& root) {
    Tree tree;
    const fs::path base = fs::u8path(root);
    for (auto it = fs::recursive_directory_iterator(base); it != fs::recursive_directory_iterator(); ++it) {
        const std::string relative = it->path().lexically_relative(base).generic_u8string();
        if (it->is_directory()) {
            tree.folders.insert(relative);
        } else {
            tree.files[relative] = ReadTextFile(it->path().u8string());
        }
    }
    return tree;
}

std::vector<std::string> FilesBelow(const std::string& root) {
    std::vector<std::string> found;
    std::error_code error;
    const fs::path base = fs::u8path(root);
    for (auto it = fs::recursive_directory_iterator(base, error); !error && it != fs::recursive_directory_iterator();
         it.increment(error)) {
        if (!it->is_directory()) found.push_back(it->path().lexically_relative(base).generic_u8string());
    }
    return found;
}

std::string SeededBytes(size_t size, unsigned seed) {
    std::mt19937 random(seed);
    std::string bytes(size, '\0');
    for (char& byte : bytes) byte = static_cast<char>(random() & 0xFF);
    return bytes;
}

void WritePatchInfo(const std::string& path, const std::vector<PatchItem>& items) {
    TiXmlDocument document;
    document.LinkEndChild(new TiXmlDeclaration("1.0", "", ""));
    TiXmlElement* root = new TiXmlElement("IronvaleWestPatch");
    document.LinkEndChild(root);
    for (const char* listName : {"FileChanges", "DirectoryChanges"}) {
        TiXmlElement* list = new TiXmlElement(listName);
        root->LinkEndChild(list);
        for (const PatchItem& item : items) {
            if (item.list != listName) continue;
            TiXmlElement* element = new TiXmlElement(item.kind);
            element->SetAttribute("Path", item.path);
            if (item.kind != "delete") element->SetAttribute("File", item.archive);
            list->LinkEndChild(element);
        }
    }
    if (!document.SaveFile(path)) throw std::runtime_error("cannot write " + path);
}

TestBatch::TestBatch(const Tree& installed, const Tree& target)
    : TestBatch(installed, target, [](const std::string&) { return std::string("patch1.dat"); }) {}

TestBatch::TestBatch(const Tree& installed, const Tree& target, ArchiveChooser chooser) {
    WriteTree(Installation(), installed);
    for (const std::string& folder : {PatchedFiles(), PatchFolder(), Served(), RecordFolder(), root / "work"}) {
        fs::create_directories(fs::u8path(folder));
    }

    // Members are packed per archive in the order of the items.
    std::map<std::string, std::vector<std::pair<std::string, std::string>>> members;  // archive: (name, file)
    auto use = [&](const std::string& kind, const std::string& path, const std::string& memberFile) {
        const std::string archive = chooser(path);
        if (std::find(archives.begin(), archives.end(), archive) == archives.end()) archives.push_back(archive);
        items.push_back({"FileChanges", kind, Backslashed(path), archive});
        members[archive].emplace_back(Backslashed(path), memberFile);
    };
    int counter = 0;
    for (const auto& file : target.files) {
        const auto old = installed.files.find(file.first);
        if (old == installed.files.end() || old->second == file.second) continue;
        const std::string number = std::to_string(counter++);
        const std::string oldPath = root / "work" + "/old" + number;
        const std::string newPath = root / "work" + "/new" + number;
        const std::string deltaPath = root / "work" + "/delta" + number;
        WriteTextFile(oldPath, old->second);
        WriteTextFile(newPath, file.second);
        MakeDelta(oldPath, newPath, deltaPath);
        use("diff", file.first, deltaPath);
    }
    for (const auto& file : target.files) {
        if (installed.files.count(file.first) != 0) continue;
        const std::string newPath = root / "work" + "/added" + std::to_string(counter++);
        WriteTextFile(newPath, file.second);
        use("new", file.first, newPath);
    }
    for (const auto& file : installed.files) {
        if (target.files.count(file.first) == 0)
            items.push_back({"FileChanges", "delete", Backslashed(file.first), ""});
    }
    // Deepest folders first, so every deletion finds its folder still there.
    for (auto folder = installed.folders.rbegin(); folder != installed.folders.rend(); ++folder) {
        if (target.folders.count(*folder) == 0) {
            items.push_back({"DirectoryChanges", "delete", Backslashed(*folder), ""});
        }
    }
    for (const std::string& folder : target.folders) {
        if (installed.folders.count(folder) == 0) items.push_back({"DirectoryChanges", "new", Backslashed(folder), ""});
    }

    for (const std::string& archive : archives) {
        ArchiveWriter writer(PathJoin(Served(), archive));
        for (const auto& member : members[archive]) {
            FileStream source;
            source.Open(member.second);
            writer.AddMember(member.first, source);
        }
        writer.Close();
    }
    WritePatchInfo(InfoPath(), items);
}

std::string TestBatch::InfoPath() const { return PathJoin(Served(), "patchinfo.xml"); }

std::list<DownloadEntry> TestBatch::FileDownloads() const {
    std::list<DownloadEntry> list;
    for (const std::string& archive : archives) {
        DownloadEntry entry;
        entry.url = "file://" + PathJoin(Served(), archive);
        entry.localPath = PathJoin(PatchFolder(), archive);
        list.push_back(entry);
    }
    return list;
}

void TestBatch::ReplaceItems(const std::vector<PatchItem>& replacement) {
    items = replacement;
    WritePatchInfo(InfoPath(), items);
}

void TestBatch::Apply(IStatusView* view) {
    BatchRun run(*this, view);
    run.StartFileDownloads();
    run.Prepare();
    run.ApplyStageTwo();
}

BatchRun::BatchRun(const TestBatch& patchBatch, IStatusView* view) : batch(patchBatch) {
    info.Load(batch.InfoPath());
    progress.SetDirectory(batch.RecordFolder());
    applier.Init(&info, &progress, batch.Installation(), batch.PatchedFiles(), batch.PatchFolder(), view, &downloader);
}

void BatchRun::StartFileDownloads() {
    if (!batch.Archives().empty()) downloader.Start(batch.FileDownloads(), false);
}

void BatchRun::ApplyStageTwo() {
    progress.SetActionIndex(-1);
    progress.SetFile("");
    progress.WriteRecord();
    applier.ApplyPatch();
}

void ApplyReports::OnApplyProgress(const std::string& fileName, int32_t permille) {
    std::lock_guard<std::mutex> lock(mutex);
    reports.push_back({fileName, permille});
}

std::vector<ApplyReports::Report> ApplyReports::Reports() const {
    std::lock_guard<std::mutex> lock(mutex);
    return reports;
}
