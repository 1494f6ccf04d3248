// Batches run through both stages on real folders: early ends, the resume of a stage two cut short, and hostile items,
// which either stage refuses before anything changes, even what the items before them would do.
#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <tuple>
#include <vector>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/archive_writer.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

// Diffs and new files large and small, deletions of files and folder
// trees, new nested and empty folders, empty files, a file and a folder
// trading places either way, names with spaces, archives taken in turn.
const Tree kInstalled =
    TreeOf(
        "game.exe=old|remove me.txt=x|sub/gone.dat=y|sub/kept.dat=kept|old/deeper/b.txt=b|old/empty/|"
        "cfg/stale.ini=s|cfg/user.ini=old|grows=|shrinks=shrinks|swap=file")
        .File("a.bin", SeededBytes(70000, 1));
const Tree kTarget =
    TreeOf(
        "game.exe=new|sub/kept.dat=kept|cfg/user.ini=new|data/nested deep/level.bin=l|readme=r|grows=now|"
        "shrinks=|new-empty=|fresh/empty/folder/|swap/swap=|old=file|Game Data/Bank 2.bnk=b")
        .File("a.bin", SeededBytes(50000, 1) + SeededBytes(30000, 2));

TEST(StageOne, EndsEarlyWithAClearErrorAndTheInstallationUntouched) {
    const std::tuple<std::function<void(BatchRun&)>, ErrorCode, std::string> cases[] = {
        {[](BatchRun& run) { run.onReport = [&run](const std::string&) { run.cancel.Cancel(); }; },
         ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Cancelled; }, ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Failed; }, ErrorCode::FileNotFound,
         "Failed to download patch file."},
        {[](BatchRun& run) { run.state = ArchiveState::Corrupt; }, ErrorCode::CorruptData, "The patch archive "},
        {[](BatchRun& run) { EXPECT_TRUE(RemoveFile(PathJoin(run.work.installationFolder, "game.exe"))); },
         ErrorCode::DeltaFailed, "Failed to apply delta file "},
    };
    for (const auto& [cause, code, message] : cases) {  // message: how it starts
        for (const size_t workers : {1, 3}) {
            SCOPED_TRACE(std::to_string(static_cast<int>(code)) + " on " + std::to_string(workers) + " workers");
            TestBatch batch(kInstalled, kTarget);
            BatchRun run(batch);
            run.workers = workers;
            cause(run);
            const Tree before = ReadTree(batch.Installation());
            try {
                run.Prepare();
                ADD_FAILURE() << "no error";
            } catch (const Exception& error) {
                EXPECT_EQ(error.Code(), code);
                EXPECT_EQ(error.message.substr(0, message.size()), message);
                EXPECT_EQ(error.message.empty(), message.empty());
            }
            EXPECT_EQ(ReadTree(batch.Installation()), before);
        }
    }
    // Prepared on one worker or on several, the files are the same, byte for byte.
    Tree prepared[2];
    for (const size_t workers : {1, 3}) {
        TestBatch batch(kInstalled, kTarget);
        BatchRun run(batch);
        run.workers = workers;
        run.Prepare();
        prepared[workers > 1] = ReadTree(batch.PatchedFiles());
    }
    EXPECT_EQ(prepared[0], prepared[1]);
}

// Stage two ends after its last action, as a crash would. "cfg" is deleted
// and then created anew: the record names the creation, and taking the
// deletion for it would throw away what the folder holds by then.
TEST(Resume, TheRecordedActionIsKnownByOrdinalAndPath) {
    TestBatch batch(kInstalled, kTarget);
    batch.description.deletedDirectories.push_back("cfg");
    batch.description.newDirectories.push_back("cfg");
    batch.WriteInfo();
    BatchRun run(batch);
    run.Prepare();
    int actions = 17;  // 5 files deleted, 4 folders deleted (cfg too), 8 created (cfg too)
    run.onReport = [&actions](const std::string&) {
        if (--actions == 0) throw std::runtime_error("interrupted");
    };
    EXPECT_THROW(run.Apply(), std::runtime_error);
    WriteTextFile(PathJoin(batch.Installation(), "cfg/notes.txt"), "the player's");
    BatchRun(batch).Resume();
    EXPECT_EQ(ReadTree(batch.Installation()), Tree(kTarget).File("cfg/notes.txt", "the player's"));
}

// An action whose record cannot be written is not carried out: the run ends
// where a crash after the action before it would have left the installation.
TEST(Resume, NoActionRunsWithoutItsRecord) {
    Tree trees[2];
    for (const bool unwritable : {false, true}) {
        TestBatch batch(kInstalled, kTarget);
        BatchRun run(batch);
        run.Prepare();
        int actions = 6;
        run.onReport = [&](const std::string&) {
            if (--actions == 0 && !unwritable) throw std::runtime_error("interrupted");
            if (actions == 0) {
                EXPECT_TRUE(MakeDirectories(PathJoin(batch.Root(), "_PPF.xml")));  // no record can be written
            }
        };
        EXPECT_ANY_THROW(run.Apply());
        trees[unwritable] = ReadTree(batch.Installation());
    }
    EXPECT_EQ(trees[1], trees[0]);
    EXPECT_FALSE(trees[1] == kInstalled);
}

// One name of every kind the check refuses.
// clang-format off
const char* const kHostileNames[] = {
    "", ".", ".\\", "./.", "a\\..\\b", "..", "\\rooted", "/rooted", "C:\\x", "C:x", "\\\\host\\share\\x",
    "a\\\\b", "*", "dat?", "*.*", "a<b", "a>b", "a|b", "a&#34;b", "a&#9;b", "trailing.", "trailing ", "dir.\\x",
    "CON", "con.txt", "Aux\\x", "nul", "COM1", "lpt9.dat", "prn", "NUL .txt", "aux  .log", "con..x", "CONIN$",
    "conout$.txt", "COM0", "com\xB9", "LPT\xC2\xB3.txt",
};
// clang-format on

// The updater's own work folder and records, which items may not reach.
const char* const kOwnNames[] = {"tempPatch", "TEMPPATCH\\patched\\x", "PPF.xml",
                                 "_ppf.xml",  "InstallationData.xml",  "uninstall.XML"};

// Where the hostile name goes: each item kind's path, or a file's archive.
const char* const kItems[] = {
    R"(<FileChanges>VICTIM<diff Path="NAME" File="patch0.lzma" /></FileChanges>)",
    R"(<FileChanges>VICTIM<new Path="NAME" File="patch0.lzma" /></FileChanges>)",
    R"(<FileChanges>VICTIM<delete Path="NAME" /></FileChanges>)",
    R"(<FileChanges>VICTIM</FileChanges><DirectoryChanges><new Path="NAME" /></DirectoryChanges>)",
    R"(<FileChanges>VICTIM</FileChanges><DirectoryChanges><delete Path="NAME" /></DirectoryChanges>)",
    R"(<FileChanges>VICTIM<new Path="fine.txt" File="NAME" /></FileChanges>)",
};

std::string Replace(std::string text, const std::string& what, const std::string& with) {
    return text.replace(text.find(what), what.size(), with);
}

class HostileItems : public ::testing::Test {
protected:
    void SetUp() override {
        WriteTree(install,
                  TreeOf("victim.txt=must survive|InstallationData.xml=<InstallationData />|tempPatch/patched/"));
        WriteTree(temp / "outside", TreeOf("keep.txt=beside the game"));
        ArchiveWriter archive(PathJoin(install, "tempPatch/patch0.lzma"));
        archive.AddStoredMember("fine.txt", EncodeLzma("fine"));
        archive.Close();
        installed = ReadTree(install);
    }

    // Runs one stage on a description whose first item deletes victim.txt,
    // with the work folders and the record inside the installation.
    void Run(const std::string& items, bool stageOne) {
        WriteTextFile(temp / "patchinfo.xml", "<IronvaleWestPatch>" +
                                                  Replace(items, "VICTIM", R"(<delete Path="victim.txt" />)") +
                                                  "</IronvaleWestPatch>");
        BatchRun run(temp.Path());
        run.work = {install, PathJoin(install, "tempPatch"), PathJoin(install, "tempPatch/patched"), "served", "2"};
        run.progress.SetDirectory(install);
        stageOne ? run.Prepare() : run.Apply();
    }

    TempFolder temp;
    std::string install = temp / "install";
    Tree installed;
};

TEST_F(HostileItems, AreRefusedInBothStagesBeforeAnythingChanges) {
    std::vector<std::pair<std::string, std::string>> cases;
    for (const char* item : kItems) {
        for (const char* name : kHostileNames) cases.emplace_back(item, name);
    }
    // Archive names lie in the work folder anyway.
    for (size_t item = 0; item + 1 < std::size(kItems); ++item) {
        for (const char* name : kOwnNames) cases.emplace_back(kItems[item], name);
    }
    for (const auto& [item, name] : cases) {
        for (const bool stageOne : {true, false}) {
            SCOPED_TRACE(Replace(item, "NAME", name) + (stageOne ? " in stage one" : " in stage two"));
            try {
                Run(Replace(item, "NAME", name), stageOne);
                ADD_FAILURE() << "accepted";
            } catch (const Exception& error) {
                EXPECT_EQ(error.code, 0);
                EXPECT_NE(error.message.find("Unsafe path in patch description"), std::string::npos) << error.message;
            }
            EXPECT_EQ(ReadTree(install), installed);  // no record, nothing prepared
            EXPECT_EQ(ReadTree(temp / "outside"), TreeOf("keep.txt=beside the game"));
        }
    }
    // Names that only look like the refused ones are ordinary files.
    for (const char* name :
         {"console.txt", "COM10.dat", "lpt.txt", "a.b.c", "with space.txt", ".hidden", "x..y", "deep\\er/mixed"}) {
        SCOPED_TRACE(name);
        Run(Replace(kItems[2], "NAME", name), false);
        EXPECT_FALSE(PathExists(PathJoin(install, "victim.txt")));
        WriteTextFile(PathJoin(install, "victim.txt"), "must survive");
    }
}

}  // namespace
