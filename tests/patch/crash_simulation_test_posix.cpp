// A power cut after any file operation of a batch, then the next start:
// the installation is the old one with its old version or exactly the new
// one with the new version, and no record is left. In the spirit of ALICE
// and CrashMonkey, unflushed data is lost or torn and unsynced creations,
// moves and removals are undone.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <functional>
#include <map>
#include <random>
#include <vector>

#include "base/file_journal.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

// Records a run's operations, then replays them one by one onto a model:
// every file and folder an inode with the bytes the program sees and those
// on the disk, names as the program sees them and as the last sync left them.
class CrashSimulator final : public IFileJournal {
public:
    // The tree below folder now is the durable start; recording starts.
    explicit CrashSimulator(const std::string& folder) : root(PathJoin(folder, "")) {
        const Tree tree = ReadTree(folder);
        for (const std::string& path : tree.folders) current[path] = durable[path] = NewInode(true, "");
        for (const auto& [path, bytes] : tree.files) current[path] = durable[path] = NewInode(false, bytes);
        SetFileJournal(this);
    }
    ~CrashSimulator() { SetFileJournal(nullptr); }

    size_t OperationCount() const { return operations.size(); }
    void Replay(size_t operation) { operations[operation](); }

    // The distinct trees a power cut now could leave; random picks where
    // unflushed writes are torn.
    std::vector<Tree> States(std::mt19937& random) const {
        std::vector<Tree> states;
        for (const auto* names : {&durable, &current}) {
            for (const Data data : {Data::Durable, Data::Torn, Data::Current}) {
                Tree tree = Image(*names, data, random);
                if (std::find(states.begin(), states.end(), tree) == states.end()) states.push_back(tree);
            }
        }
        return states;
    }

    std::vector<std::string> outside;  // paths outside the folder that the run changed

    void Created(const std::string& path, bool truncated) override {
        Record(path, [this, truncated](const std::string& file) {
            if (current.count(file) == 0) {
                current[file] = NewInode(false, "");
            } else if (truncated) {
                inodes[current.at(file)].current.clear();
            }
        });
    }
    void Wrote(const std::string& path, int64_t offset, const void* data, uint32_t size) override {
        Record(path,
               [this, offset, bytes = std::string(static_cast<const char*>(data), size)](const std::string& file) {
                   std::string& content = inodes[current.at(file)].current;
                   if (content.size() < offset + bytes.size()) content.resize(offset + bytes.size(), '\0');
                   content.replace(static_cast<size_t>(offset), bytes.size(), bytes);
               });
    }
    void Flushed(const std::string& path) override {
        Record(path, [this](const std::string& file) {
            inodes[current.at(file)].durable = inodes[current.at(file)].current;
        });
    }
    void Moved(const std::string& from, const std::string& to) override {
        std::string target = to;
        if (!Relative(target)) return;
        Record(from, [this, target](const std::string& source) {
            current[target] = current.at(source);
            current.erase(source);
        });
    }
    void RemovedFile(const std::string& path) override { RemovedDirectory(path); }  // nothing lies below
    void MadeDirectories(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (size_t slash = 0; slash != std::string::npos;) {
                slash = folder.find('/', slash + 1);
                if (current.count(folder.substr(0, slash)) == 0) current[folder.substr(0, slash)] = NewInode(true, "");
            }
        });
    }
    void RemovedDirectory(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (auto it = current.begin(); it != current.end();) {
                const bool below = it->first == folder || it->first.rfind(folder + "/", 0) == 0;
                it = below ? current.erase(it) : std::next(it);
            }
        });
    }
    void SyncedFolder(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (auto it = durable.begin(); it != durable.end();) {
                it = GetParentDirectory(it->first) == folder ? durable.erase(it) : std::next(it);
            }
            for (const auto& entry : current) {
                if (GetParentDirectory(entry.first) == folder) durable[entry.first] = entry.second;
            }
        });
    }

private:
    struct Inode {
        bool folder;
        std::string current;
        std::string durable;
    };
    enum class Data { Durable, Torn, Current };
    using Names = std::map<std::string, size_t>;

    size_t NewInode(bool folder, const std::string& bytes) {
        inodes.push_back(Inode{folder, bytes, bytes});
        return inodes.size() - 1;
    }

    // The path relative to the folder ("" for the folder itself).
    bool Relative(std::string& path) {
        const bool inside = (path + "/").rfind(root, 0) == 0;
        if (!inside) outside.push_back(path);
        path = inside ? (path + "/").substr(root.size()) : path;
        while (!path.empty() && path.back() == '/') path.pop_back();
        return inside;
    }

    void Record(std::string path, std::function<void(const std::string&)> operation) {
        if (Relative(path)) operations.push_back([operation, path] { operation(path); });
    }

    Tree Image(const Names& names, Data data, std::mt19937& random) const {
        Tree tree;
        for (const auto& [path, id] : names) {  // parents first: a name is reachable when its folder is
            const std::string parent = GetParentDirectory(path);
            if (!parent.empty() && tree.folders.count(parent) == 0) continue;
            const Inode& inode = inodes[id];
            if (inode.folder) {
                tree.folders.insert(path);
                continue;
            }
            std::string bytes = data == Data::Durable ? inode.durable : inode.current;
            if (data == Data::Torn && inode.current != inode.durable) bytes.resize(random() % (bytes.size() + 1));
            tree.files[path] = bytes;
        }
        return tree;
    }

    const std::string root;
    std::vector<Inode> inodes;
    Names current;
    Names durable;
    std::vector<std::function<void()>> operations;
};

// Runs the batch once under the simulator, then the next start on every
// crash state after every operation.
void SimulateEveryCrash(const TestBatch& batch, const Tree& installed, const Tree& target) {
    CrashSimulator simulator(batch.Root());
    BatchRun run(batch);
    run.Prepare();
    run.Apply();
    SetFileJournal(nullptr);
    ASSERT_EQ(simulator.outside, std::vector<std::string>());

    std::mt19937 random(1);
    int checked = 0, failures = 0;
    for (size_t k = 0; k <= simulator.OperationCount() && failures < 3; ++k) {
        if (k > 0) simulator.Replay(k - 1);
        for (const Tree& state : simulator.States(random)) {
            ++checked;
            std::filesystem::remove_all(batch.Root());
            WriteTree(batch.Root(), state);
            std::string outcome;
            try {
                BatchRun(batch).Resume();
                const std::string version = ReadTextFile(batch.VersionFile());
                const Tree game = ReadTree(batch.Installation());
                if (!(version == "1" && game == installed) && !(version == "2" && game == target)) {
                    outcome = "version " + version + (game == target ? ", new tree" : ", another tree");
                }
                for (const char* record : {"PPF.xml", "_PPF.xml"}) {
                    if (PathExists(PathJoin(batch.Root(), record))) outcome += " record left";
                }
            } catch (const std::exception& error) {
                outcome = error.what();
            }
            EXPECT_EQ(outcome, "") << "after operation " << k << " of " << simulator.OperationCount();
            failures += outcome.empty() ? 0 : 1;
        }
    }
    std::printf("crash states checked: %d\n", checked);
}

// A file deleted and made anew, a folder that becomes a file: a resume that
// repeated the last deletion after the moves had begun would throw the new
// file away.
TEST(CrashSimulation, DeletionsFollowedByNewItemsOfTheSameName) {
    const Tree installed = TreeOf("game.exe=old game|F.txt=old F|D/inner.txt=inside D|gone.txt=bye|keep/kept.txt=k");
    const Tree target = TreeOf("game.exe=new game|F.txt=new F|D=D is a file now|keep/kept.txt=k");
    TestBatch batch(installed, target);
    batch.description.deletedFiles.push_back("F.txt");
    batch.WriteInfo();
    SimulateEveryCrash(batch, installed, target);
}

// The publisher's own patch between two generated trees: edits, additions,
// removals, files and folders trading places, several archives.
TEST(CrashSimulation, PublishedPatchOfGeneratedTrees) {
    const Tree installed = RandomTree(3);
    const Tree target = NextVersion(installed, 3);
    SimulateEveryCrash(TestBatch(installed, target, true), installed, target);
}

}  // namespace
