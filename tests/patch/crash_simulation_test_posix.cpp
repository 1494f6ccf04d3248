// A power cut at any moment of a batch, followed by the next start: the
// installation is either the old one with its old version or exactly the
// new one with the new version, no record is left, and nothing outside the
// installation changed. Every operation boundary of a real run is tried
// with every state the simulator builds for it.

#include <gtest/gtest.h>

#include <cstdio>
#include <random>

#include "base/archive_source.h"
#include "base/atomic_file.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "tests/patch/crash_simulator.h"
#include "tests/support/test_files.h"
#include "tools/publisher/archive_writer.h"
#include "tools/publisher/delta_maker.h"
#include "tools/publisher/patch_builder.h"

namespace {

// Archives that are already in the patch folder, as a finished download
// leaves them.
class ArchivesInPlace final : public IArchiveSource {
public:
    ArchiveState WaitForArchive(const std::string&) override { return ArchiveState::Arrived; }
};

FolderImage Below(const std::string& prefix, const FolderImage& image) {
    FolderImage part;
    for (const auto& entry : image) part[prefix + "/" + entry.first] = entry.second;
    return part;
}

class CrashSimulation : public ::testing::Test {
protected:
    // The batch as the updater runs it, on root/install with its work
    // folder install/tempPatch holding a copy of the patch folder.
    void RunBatch(const std::string& patchDir, bool resuming = false) {
        const std::string install = PathJoin(root, "install");
        PatchBatch batch{
            install,    PathJoin(install, "tempPatch"), PathJoin(install, "tempPatch/patched"), patchDir, "2",
            {"version"}};
        PatchInfoFile info;
        info.Load(PathJoin(batch.patchFolder, "patchinfo.xml"));
        PatchProgressFile progress;
        progress.SetDirectory(install);
        progress.resuming = resuming;
        if (resuming) progress.Recover();
        PatchApplier applier;
        PatchStages stages(info, progress, applier);
        ArchivesInPlace archives;
        if (!resuming) stages.Prepare(batch, &archives, nullptr);
        stages.Apply(batch, nullptr, [&install](const std::string& version) {
            return ReplaceFileAtomically(PathJoin(install, "version"), version);
        });
    }

    FolderImage Installation(const FolderImage& game, const std::string& patchDir) {
        FolderImage image = Below("install", game);
        image["install/version"] = "1";
        image["install/tempPatch"] = std::nullopt;
        image["install/tempPatch/patched"] = std::nullopt;
        for (const auto& entry : ReadFolderImage(patchDir)) image["install/tempPatch/" + entry.first] = entry.second;
        image["outside/keep.txt"] = "beside the game";
        return image;
    }

    // What the next start does: resume, reinstall, or nothing.
    void Recover(const FolderImage& state) {
        const std::string install = PathJoin(root, "install");
        const std::string version = state.count("install/version") ? state.at("install/version").value_or("") : "";
        PatchProgressFile progress;
        progress.SetDirectory(install);
        switch (FindInterruptedBatch(version, progress)) {
            case InterruptedBatch::None:
                return;
            case InterruptedBatch::Resume:
                return RunBatch(progress.GetPatchUri(), true);
            case InterruptedBatch::Reinstall: {
                ++reinstalls;
                DeleteDirectory(PathJoin(install, "tempPatch"), true);
                FolderImage image = ReadFolderImage(root);
                for (const auto& entry : ReadFolderImage(buildDir)) {
                    image["install/tempPatch/" + entry.first] = entry.second;
                }
                image["install/tempPatch/patched"] = std::nullopt;
                WriteFolderImage(root, image);
                return RunBatch(buildDir);
            }
        }
    }

    // Runs the batch once under the simulator, then recovers from every
    // crash state after every operation.
    void SimulateEveryCrash(const FolderImage& oldGame, const FolderImage& newGame, const std::string& patchDir) {
        const FolderImage initial = Installation(oldGame, patchDir);
        WriteFolderImage(root, initial);
        CrashSimulator simulator(root);
        simulator.StartRecording();
        RunBatch(patchDir);
        simulator.StopRecording();
        ASSERT_TRUE(simulator.Outside().empty()) << simulator.Outside().front();

        int failures = 0;
        for (size_t k = 0; k <= simulator.OperationCount() && failures < 3; ++k) {
            const std::vector<FolderImage> states = simulator.CrashStates(k, static_cast<uint32_t>(k));
            for (size_t i = 0; i < states.size() && failures < 3; ++i) {
                WriteFolderImage(root, states[i]);
                Recover(states[i]);
                ++checked;
                const FolderImage after = ReadFolderImage(root);
                FolderImage game;
                std::string version;
                bool records = false;
                bool outsideKept = after.count("outside/keep.txt") && after.at("outside/keep.txt") == "beside the game";
                for (const auto& entry : after) {
                    const std::string& path = entry.first;
                    if (path == "install/version") {
                        version = entry.second.value_or("");
                    } else if (path == "install/PPF.xml" || path == "install/_PPF.xml") {
                        records = true;
                    } else if (path == "install/~version.tmp") {
                        // A cut-off atomic replacement; the next one reuses it.
                    } else if (path.rfind("install/", 0) == 0 && path.rfind("install/tempPatch", 0) != 0) {
                        game[path.substr(8)] = entry.second;
                    } else if (path.rfind("install", 0) != 0 && path != "outside" && path != "outside/keep.txt") {
                        outsideKept = false;
                    }
                }
                const bool old = game == oldGame && version == "1";
                const bool done = game == newGame && version == "2";
                if ((!old && !done) || records || !outsideKept) {
                    ++failures;
                    ADD_FAILURE() << "after operation " << k << " of " << simulator.OperationCount() << ", state " << i
                                  << ": version \"" << version << "\", " << (records ? "records left, " : "")
                                  << (outsideKept ? "" : "outside changed, ") << "tree "
                                  << (game == oldGame   ? "old"
                                      : game == newGame ? "new"
                                                        : "mixed");
                }
            }
        }
    }

    TempFolder temp;
    std::string root = temp / "root";
    std::string buildDir;
    int checked = 0;
    int reinstalls = 0;
};

std::string Bytes(size_t size, unsigned seed) {
    std::mt19937 random(seed);
    std::string bytes(size, '\0');
    for (char& c : bytes) c = static_cast<char>("abcdefgh \n"[random() % 10]);
    return bytes;
}

std::string BuildFrom(const std::string& out, const std::string& from, const std::string& to) {
    BuildOptions options;
    options.fromDir = from;
    options.toDir = to;
    options.version = "2";
    options.outDir = out;
    options.maxArchiveSize = 3000;
    return BuildPatch(options);
}

// A file deleted and added anew, and a folder that becomes a file: a
// resume that repeated the last deletion after the moves had begun would
// throw the new file away.
TEST_F(CrashSimulation, DeletionsFollowedByNewItemsOfTheSameName) {
    const std::string exe = Bytes(6000, 1);
    std::string exeNew = exe;
    exeNew.replace(2000, 40, Bytes(40, 2));
    const FolderImage oldGame = {{"game.exe", exe},           {"F.txt", "old F"},  {"D", std::nullopt},
                                 {"D/inner.txt", "inside D"}, {"gone.txt", "bye"}, {"keep", std::nullopt},
                                 {"keep/kept.txt", "kept"}};
    const FolderImage newGame = {{"game.exe", exeNew},
                                 {"F.txt", "new F"},
                                 {"D", "D is a file now"},
                                 {"keep", std::nullopt},
                                 {"keep/kept.txt", "kept"}};

    const std::string patchDir = temp / "patch";
    WriteFolderImage(patchDir, {{"old.exe", exe}, {"new.exe", exeNew}});
    MakeCheckedDelta(PathJoin(patchDir, "old.exe"), PathJoin(patchDir, "new.exe"), PathJoin(patchDir, "delta"),
                     PathJoin(patchDir, "scratch"));
    {
        ArchiveWriter archive(PathJoin(patchDir, "patch0.lzma"));
        archive.AddStoredMember("game.exe", EncodeLzma(ReadTextFile(PathJoin(patchDir, "delta"))));
        archive.AddStoredMember("F.txt", EncodeLzma("new F"));
        archive.AddStoredMember("D", EncodeLzma("D is a file now"));
        archive.Close();
    }
    for (const char* name : {"old.exe", "new.exe", "delta"}) RemoveFile(PathJoin(patchDir, name));
    WriteTextFile(PathJoin(patchDir, "patchinfo.xml"), R"(<IronvaleWestPatch>
  <FileChanges>
    <diff Path="game.exe" File="patch0.lzma" />
    <delete Path="F.txt" /><delete Path="gone.txt" />
    <new Path="F.txt" File="patch0.lzma" /><new Path="D" File="patch0.lzma" />
  </FileChanges>
  <DirectoryChanges><delete Path="D" /></DirectoryChanges>
</IronvaleWestPatch>)");
    WriteFolderImage(temp / "new", newGame);
    BuildOptions complete;
    complete.toDir = temp / "new";
    complete.version = "2";
    complete.outDir = temp / "out";
    buildDir = BuildPatch(complete);

    SimulateEveryCrash(oldGame, newGame, patchDir);
    EXPECT_EQ(reinstalls, 0);
    std::printf("crash states checked: %d\n", checked);
}

// A patch as the publisher's tool makes it from two generated trees:
// edited, added and removed files, new and removed folders, a file and a
// folder swapping places, several archives.
TEST_F(CrashSimulation, PublishedPatchOfGeneratedTrees) {
    FolderImage oldGame;
    FolderImage newGame;
    std::mt19937 random(7);
    for (int i = 0; i < 12; ++i) {
        const std::string folder = "data" + std::to_string(i % 3);
        const std::string name = folder + "/file" + std::to_string(i) + ".bin";
        const std::string content = Bytes(500 + random() % 2500, i);
        oldGame[folder] = newGame[folder] = std::nullopt;
        switch (i % 4) {
            case 0:  // edited
                oldGame[name] = content;
                newGame[name] = content.substr(0, content.size() / 2) + "edited" + content.substr(content.size() / 2);
                break;
            case 1:  // removed
                oldGame[name] = content;
                break;
            case 2:  // added
                newGame[name] = content;
                break;
            default:  // kept
                oldGame[name] = newGame[name] = content;
        }
    }
    oldGame["swap"] = std::nullopt;
    oldGame["swap/was a folder.txt"] = "x";
    newGame["swap"] = "now a file";
    oldGame["old folder"] = std::nullopt;
    newGame["new/nested"] = newGame["new"] = std::nullopt;
    newGame["new/nested/deep.txt"] = "deep";
    WriteFolderImage(temp / "old", oldGame);
    WriteFolderImage(temp / "new", newGame);
    const std::string patchDir = BuildFrom(temp / "out", temp / "old", temp / "new");
    BuildOptions complete;
    complete.toDir = temp / "new";
    complete.version = "2";
    complete.outDir = temp / "out";
    buildDir = BuildPatch(complete);

    SimulateEveryCrash(oldGame, newGame, patchDir);
    EXPECT_EQ(reinstalls, 0);
    std::printf("crash states checked: %d\n", checked);
}

}  // namespace
