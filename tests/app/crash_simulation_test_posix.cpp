// A power cut after any file operation of an update, then the program's next start: the installation is the old one
// with its old version or exactly the new one with the new version, the uninstall record lists what the batch added,
// and no work folder or record is left. The batch runs as the program lays it out (work folders and records inside
// the installation, the description written from the checked bytes), and the next start takes the program's own
// decision on what it finds: resume, prepare again, install the complete build, or nothing. In the spirit of ALICE
// and CrashMonkey, unflushed data is lost or torn, and each folder keeps any prefix of its unsynced entry changes.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <functional>
#include <map>
#include <mutex>
#include <random>
#include <vector>

#include "app/installation_records.h"
#include "app/temporary_files.h"
#include "app/update_plan.h"
#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_journal.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "state/installation_data.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/patch_builder.h"

namespace {

namespace fs = std::filesystem;
using Names = std::map<std::string, size_t>;  // path -> inode

// Records a run's operations, then replays them one by one onto a model: every file and folder an inode with the
// bytes the program sees and those on the disk; the names as the program sees them, as the last sync of their folder
// left them, and each state a folder's entries passed through since.
class CrashSimulator final : public IFileJournal {
public:
    explicit CrashSimulator(const std::string& folder) : root(PathJoin(folder, "")) {
        const Tree tree = ReadTree(folder);
        for (const std::string& path : tree.folders) current[path] = NewInode(true, "");
        for (const auto& [path, bytes] : tree.files) current[path] = NewInode(false, bytes);
        durable = current;
        SetFileJournal(this);
    }
    ~CrashSimulator() { SetFileJournal(nullptr); }

    size_t OperationCount() const { return operations.size(); }
    void Replay(size_t operation) { operations[operation](); }

    // The distinct trees a power cut now could leave: every name lost or kept, with unflushed data lost, torn or
    // kept; and each folder at each state it passed through, the others all lost or all kept.
    std::vector<Tree> States(std::mt19937& random) const {
        std::vector<Tree> states;
        const auto add = [&](const Tree& tree) {
            if (std::find(states.begin(), states.end(), tree) == states.end()) states.push_back(tree);
        };
        for (const Names* names : {&durable, &current}) {
            for (const Data data : {Data::Durable, Data::Torn, Data::Current}) add(Image(*names, data, random));
        }
        // A seeded few of the folder states keep large batches quick.
        std::vector<std::pair<const std::string*, const Names*>> partial;
        for (const auto& [folder, passed] : history) {
            for (const Names& entries : passed) partial.emplace_back(&folder, &entries);
        }
        std::shuffle(partial.begin(), partial.end(), random);
        partial.resize(std::min<size_t>(partial.size(), kFolderStates));
        for (const auto& [folder, entries] : partial) {
            for (const Names* others : {&durable, &current}) {
                Names names = *others;
                for (auto it = names.begin(); it != names.end();) {
                    it = GetParentDirectory(it->first) == *folder ? names.erase(it) : std::next(it);
                }
                names.insert(entries->begin(), entries->end());
                add(Image(names, Data::Durable, random));
            }
        }
        return states;
    }

    std::vector<std::string> outside;  // paths outside the folder that the run changed

    void Created(const std::string& path, bool truncated) override {
        Record(path, [this, truncated](const std::string& file) {
            if (current.count(file) == 0) {
                current[file] = NewInode(false, "");
                Changed(GetParentDirectory(file));
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
        std::lock_guard<std::recursive_mutex> lock(recording);
        std::string target = to;
        if (!Relative(target)) return;
        Record(from, [this, target](const std::string& source) {
            current[target] = current.at(source);
            current.erase(source);
            Changed(GetParentDirectory(source));
            Changed(GetParentDirectory(target));
        });
    }
    void RemovedFile(const std::string& path) override { RemovedDirectory(path); }  // nothing lies below
    void MadeDirectories(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (size_t slash = 0; slash != std::string::npos;) {
                slash = folder.find('/', slash + 1);
                const std::string made = folder.substr(0, slash);
                if (current.count(made) == 0) {
                    current[made] = NewInode(true, "");
                    Changed(GetParentDirectory(made));
                }
            }
        });
    }
    void RemovedDirectory(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (auto it = current.begin(); it != current.end();) {
                const bool below = it->first == folder || it->first.rfind(folder + "/", 0) == 0;
                it = below ? current.erase(it) : std::next(it);
            }
            Changed(GetParentDirectory(folder));
        });
    }
    void SyncedFolder(const std::string& path) override {
        Record(path, [this](const std::string& folder) {
            for (auto it = durable.begin(); it != durable.end();) {
                it = GetParentDirectory(it->first) == folder ? durable.erase(it) : std::next(it);
            }
            const Names entries = EntriesOf(current, folder);
            durable.insert(entries.begin(), entries.end());
            history.erase(folder);
        });
    }

private:
    struct Inode {
        bool folder;
        std::string current;
        std::string durable;
    };
    enum class Data { Durable, Torn, Current };
    static constexpr size_t kFolderStates = 3;

    size_t NewInode(bool folder, const std::string& bytes) {
        inodes.push_back(Inode{folder, bytes, bytes});
        return inodes.size() - 1;
    }

    static Names EntriesOf(const Names& names, const std::string& folder) {
        Names entries;
        for (const auto& entry : names) {
            if (GetParentDirectory(entry.first) == folder) entries.insert(entry);
        }
        return entries;
    }
    // The folder's entries changed without a sync: one more state they may be found in.
    void Changed(const std::string& folder) { history[folder].push_back(EntriesOf(current, folder)); }

    // The path relative to the folder ("" for the folder itself).
    bool Relative(std::string& path) {
        const bool inside = (path + "/").rfind(root, 0) == 0;
        if (!inside) outside.push_back(path);
        path = inside ? (path + "/").substr(root.size()) : path;
        while (!path.empty() && path.back() == '/') path.pop_back();
        return inside;
    }

    // Stage one's workers write side by side: their operations are recorded one at a time, in the order they
    // happen.
    void Record(std::string path, std::function<void(const std::string&)> operation) {
        std::lock_guard<std::recursive_mutex> lock(recording);
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
    std::map<std::string, std::vector<Names>> history;  // folder -> its entries after each unsynced change
    std::vector<std::function<void()>> operations;
    std::recursive_mutex recording;
};

struct Arrived final : IArchiveSource {
    ArchiveState WaitForArchive(const std::string&) override { return ArchiveState::Arrived; }
};

// The installation "game" (version 1, with its records), and the server's patch and complete build of version 2.
class Update {
public:
    // The server offers the complete build of target; patch, when given, is the folder of a patch to serve,
    // else the publisher makes one.
    Update(const Tree& installedTree, const Tree& targetTree, const std::string& patch = "")
        : installed(installedTree), target(targetTree) {
        WriteTree(game, installed);
        WriteTree(server / "new", target);
        BuildPatch({"", server / "new", "2", server.Path(), 3000});
        if (patch.empty()) BuildPatch({game, server / "new", "2", server.Path(), 3000});
        if (!patch.empty()) fs::rename(patch, server / "patch_515195_2");
        fs::remove_all(server / "new");
        SetVersion("1");
        layout = {game, PathJoin(game, "tempPatch"), PathJoin(game, "tempPatch/patched"), server.Path(), server.Path()};
    }
    // The batch of the server's folder name, as the program lays it out.
    PatchBatch Batch(const std::string& name) const {
        return {game, layout.patchFolder, layout.patchedFilesFolder, server / name, "2"};
    }
    void SetVersion(const std::string& version) {
        WriteTextFile(PathJoin(game, kInstallationDataFileName),
                      "<InstallationData><CurrentVersion>" + version +
                          "</CurrentVersion><PatcherVersion>3</PatcherVersion></InstallationData>");
    }

    // What the program's run does with a batch once its archives have arrived.
    void Install(const PatchBatch& batch, const std::optional<ResumePoint>& resumeAt = std::nullopt) {
        const std::string description = ReadTextFile(PathJoin(batch.location, "patchinfo.xml"));
        if (!resumeAt) {
            EXPECT_TRUE(MakeDirectories(batch.patchedFilesFolder));
            ASSERT_TRUE(ReplaceFileAtomically(PathJoin(batch.patchFolder, "patchinfo.xml"), description));
        }
        PatchInfoFile info;
        info.Parse(description);
        PatchProgressFile progress;
        progress.SetDirectory(game);
        InstallationData data;
        data.Load(game);
        InstallationRecords records(data, {"SOFTWARE\\Halvard\\Ironvale", "{guid}", true, ""});
        PatchStages stages(batch, info, progress, StageServices{nullptr, nullptr, nullptr, 3});  // workers side by side
        const auto prepare = [&] {
            for (const auto& entry : fs::directory_iterator(batch.location)) {
                fs::copy_file(entry.path(), PathJoin(batch.patchFolder, entry.path().filename()),
                              fs::copy_options::overwrite_existing);
            }
            stages.Prepare(arrived);
        };
        if (!resumeAt) prepare();
        try {
            stages.Apply(&records, resumeAt);
        } catch (const Exception& error) {
            if (error.Code() != ErrorCode::PreparedFilesMissing) throw;
            prepare();
            stages.Apply(&records, resumeAt);
        }
        CleanTemporaryFiles(batch.patchFolder, batch.patchedFilesFolder);
    }

    // The program's next start, from its own decision on what it finds.
    void NextStart() {
        for (int pass = 0; pass < 3; ++pass) {
            InstallationData data;
            data.Load(game);
            PatchProgressFile progress;
            progress.SetDirectory(game);
            UpdateFacts facts;
            facts.installedVersion = data.currentVersion;
            facts.patcherVersion = data.patcherVersion;
            facts.latestVersion = "2";
            facts.interrupted = FindInterruptedBatch(data.currentVersion, progress);
            if (facts.interrupted.kind == InterruptedBatch::Kind::Resume) {
                PatchInfoFile info;
                facts.recordedDescription.text = ReadTextFile(PathJoin(layout.patchFolder, "patchinfo.xml"));
                info.Parse(facts.recordedDescription.text);
                // As the program without a key takes it.
                facts.recordedDescriptionFits =
                    info.GetVersion().empty() || info.GetVersion() == facts.interrupted.batch.version;
            }
            const UpdatePlan plan = PlanUpdate(facts, layout);
            if (plan.road != Road::Resume) {
                RemoveLeftovers(game, layout.patchFolder, layout.patchedFilesFolder, plan.road != Road::UpToDate);
            }
            if (plan.road == Road::Reinstall) {
                DiscardFile(progress.GetRecordPath());
                Install(plan.batch);
            }
            if (plan.road != Road::Resume) return;
            try {
                Install(plan.batch, plan.resumeAt);
            } catch (const Exception& error) {
                if (error.Code() != ErrorCode::ReinstallRequired) throw;
                EXPECT_TRUE(RemoveFile(progress.GetRecordPath()));  // the next pass installs the complete build
            }
        }
    }

    // Empty when the installation is the old one at version 1 or exactly the new one at 2 with the batch's additions
    // in the uninstall record, and nothing of the run is left.
    std::string Outcome() {
        InstallationData data;
        data.Load(game);
        Tree tree = ReadTree(game);
        for (const char* own : {kInstallationDataFileName, kUninstallRecordName, "UpdateHistory.log"}) {
            tree.files.erase(own);
        }
        std::string outcome;
        if (!(data.currentVersion == "1" && tree == installed) && !(data.currentVersion == "2" && tree == target)) {
            outcome = "version " + data.currentVersion + (tree == target ? ", new tree" : ", another tree");
        }
        const std::string record = data.currentVersion == "2" ? ReadTextFile(PathJoin(game, kUninstallRecordName)) : "";
        for (const auto& file : target.files) {
            if (!record.empty() && installed.files.count(file.first) == 0 &&
                record.find(PathJoin(game, file.first)) == std::string::npos) {
                outcome += " unrecorded " + file.first;
            }
        }
        for (const char* left : {"tempPatch", kProgressRecordName, kSpareProgressRecordName}) {
            if (PathExists(PathJoin(game, left))) outcome += std::string(" left ") + left;
        }
        return outcome;
    }

    // Runs the batch once under the simulator, then the next start on every crash state after every operation;
    // the number of states checked.
    int SimulateEveryCrash(const PatchBatch& batch) {
        CrashSimulator simulator(game);
        Install(batch);
        SetFileJournal(nullptr);
        EXPECT_EQ(simulator.outside, std::vector<std::string>());
        EXPECT_EQ(Outcome(), "");
        std::mt19937 random(1);
        int checked = 0, failures = 0;
        for (size_t k = 0; k <= simulator.OperationCount() && failures < 3; ++k) {
            if (k > 0) simulator.Replay(k - 1);
            for (const Tree& state : simulator.States(random)) {
                ++checked;
                fs::remove_all(game);
                WriteTree(game, state);
                std::string outcome;
                try {
                    NextStart();
                    outcome = Outcome();
                } catch (const std::exception& error) {
                    outcome = error.what();
                } catch (const Exception& error) {
                    outcome = error.message;
                }
                EXPECT_EQ(outcome, "") << "after operation " << k << " of " << simulator.OperationCount();
                failures += outcome.empty() ? 0 : 1;
            }
        }
        std::printf("crash states checked: %d\n", checked);
        return checked;
    }

    // In memory: the crash states are the simulator's, so the real syncs only cost time.
    TempFolder root{"/dev/shm"};
    TempFolder server;  // the patch and the complete build, beside the recorded folder
    const std::string game = root / "game";
    const Tree installed;
    const Tree target;
    UpdateLayout layout;
    Arrived arrived;
};

// A file deleted and made anew, a folder that becomes a file: a resume that repeated the last deletion after the
// moves had begun would throw the new file away.
TEST(CrashSimulation, DeletionsFollowedByNewItemsOfTheSameName) {
    const Tree installed = TreeOf("game.exe=old game|F.txt=old F|D/inner.txt=inside D|gone.txt=bye|keep/kept.txt=k");
    const Tree target = TreeOf("game.exe=new game|F.txt=new F|D=D is a file now|keep/kept.txt=k");
    TestBatch batch(installed, target);
    batch.description.deletedFiles.push_back("F.txt");
    batch.WriteInfo();
    fs::rename(batch.Root() + "/patchinfo.xml", batch.PatchFolder() + "/patchinfo.xml");
    Update update(installed, target, batch.PatchFolder());
    EXPECT_GE(update.SimulateEveryCrash(update.Batch("patch_515195_2")), 300);
}

// The publisher's own patch between two generated trees: edits, additions, removals, files and folders trading
// places, several archives.
TEST(CrashSimulation, PublishedPatchOfGeneratedTrees) {
    Tree installed = RandomTree(3);
    for (auto& file : installed.files) file.second.resize(std::min<size_t>(file.second.size(), 4000));  // quicker
    Update update(installed, NextVersion(installed, 3));
    EXPECT_GE(update.SimulateEveryCrash(update.Batch("patch_515195_2")), 700);
}

// The complete build over a tree it does not fit (a file where it needs a folder, a folder where it needs a file),
// as the repair offers it: it finishes whatever the cut.
TEST(CrashSimulation, CompleteBuildOverAConflictingTree) {
    Update update(TreeOf("game.exe=v1|data/config=a file|a/b.txt=in a folder"),
                  TreeOf("game.exe=v2|data/config/x.ini=in a folder now|a=a file now"));
    EXPECT_GE(update.SimulateEveryCrash(update.Batch("build_2")), 250);
}

}  // namespace
