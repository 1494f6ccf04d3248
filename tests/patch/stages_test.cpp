// Batches made from two trees, run through both stages on real folders:
// the result, the ways they end early, and the resume of a stage two cut
// short.
#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

// Diffs large and small, files new in new nested folders, deletions of
// files and folder trees, empty files and folders, a file and a folder
// trading places, names with spaces, and archives taken in turn.
TEST(Batch, InstallationEndsEqualToTheTargetAndEveryItemIsReported) {
    Tree installed = TreeOf("old/inner/gone.txt=gone|old/empty/|grows=|shrinks=shrinks|removed=old|swap=file");
    Tree target = TreeOf("grows=now it has content|shrinks=|new-empty=|fresh/empty/folder/|swap/swap=|old=file");
    installed.File("a.bin", SeededBytes(200000, 1)).File("Game Data/Bank 1.bnk", SeededBytes(8000, 2));
    target.File("a.bin", SeededBytes(150000, 1) + SeededBytes(60000, 3)).File("Game Data/Bank 1.bnk", "short");
    target.File("Game Data/New Folder/deep/Bank 2.bnk", SeededBytes(70000, 5)).File("zed.bin", SeededBytes(900, 6));
    TestBatch batch(installed, target);
    // A longer file left by an earlier attempt must not keep its tail.
    WriteTree(batch.PatchedFiles(), Tree().File("Game Data/Bank 1.bnk", SeededBytes(50000, 7)));
    BatchRun run(batch);
    run.Prepare();
    run.Apply();
    EXPECT_EQ(ReadTree(batch.Installation()), target);
    EXPECT_TRUE(ReadTree(batch.PatchedFiles()).files.empty());
    EXPECT_FALSE(PathExists(PathJoin(batch.PatchFolder(), "diffTempFile.dz")));

    ASSERT_EQ(run.reports.size(), static_cast<size_t>(run.info.CountFileAndDirectoryChanges()));
    EXPECT_EQ(run.reports.front().first, "Bank 1.bnk");
    EXPECT_EQ(run.reports.back().second, 1000);
    for (size_t i = 1; i < run.reports.size(); ++i) EXPECT_GT(run.reports[i].second, run.reports[i - 1].second);
}

const Tree kInstalled = TreeOf(
    "game.exe=old|remove me.txt=x|sub/gone.dat=y|sub/kept.dat=kept|old/deeper/b.txt=b|"
    "cfg/stale.ini=s|cfg/user.ini=old");
const Tree kTarget = TreeOf("game.exe=new|sub/kept.dat=kept|cfg/user.ini=new|data/nested deep/level.bin=l|readme=r");
const int kActions = 10;  // 4 files deleted, 3 folders deleted, 3 created

// Besides the changes from tree to tree, "cfg" is deleted and then created
// anew as the last action: one path, two actions.
void RecreateCfg(TestBatch& batch) {
    batch.description.deletedDirectories.push_back("cfg");
    batch.description.newDirectories.push_back("cfg");
    batch.WriteInfo();
}

TEST(StageOne, EndsEarlyWithAClearErrorAndTheInstallationUntouched) {
    const struct {
        std::function<void(BatchRun&)> cause;
        ErrorCode code;
        std::string message;  // its start
    } cases[] = {
        {[](BatchRun& run) { run.onReport = [&run](const std::string&) { run.applier.RequestCancel(); }; },
         ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Cancelled; }, ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Failed; }, ErrorCode::FileNotFound,
         "Failed to download patch file."},
        {[](BatchRun& run) { RemoveFile(PathJoin(run.work.installationFolder, "game.exe")); }, ErrorCode::DeltaFailed,
         "Failed to apply delta file "},
    };
    for (const auto& test : cases) {
        SCOPED_TRACE(static_cast<int>(test.code));
        TestBatch batch(kInstalled, kTarget);
        BatchRun run(batch);
        test.cause(run);
        const Tree before = ReadTree(batch.Installation());
        try {
            run.Prepare();
            ADD_FAILURE() << "no error";
        } catch (const Exception& error) {
            EXPECT_EQ(error.Code(), test.code);
            EXPECT_EQ(error.message.substr(0, test.message.size()), test.message);
            EXPECT_EQ(error.message.empty(), test.message.empty());
        }
        EXPECT_EQ(ReadTree(batch.Installation()), before);
    }
}

// A hostile item after harmless ones is refused by either stage before
// anything changes: one row per attribute that names a path, and every
// form of escape.
TEST(HostileDescription, IsRefusedInBothStagesBeforeAnythingChanges) {
    const std::pair<std::string, std::string> hostile[] = {
        {"FileChanges", R"(<delete Path="..\outside.txt" />)"},
        {"FileChanges", R"(<delete Path="/etc/passwd" />)"},
        {"FileChanges", R"(<new Path="\\host\share\x" File="data.dat" />)"},
        {"FileChanges", R"(<new Path="data\c.bin" File="..\patch\data.dat" />)"},
        {"FileChanges", R"(<diff Path="data/../../x.bin" File="data.dat" />)"},
        {"FileChanges", R"(<diff Path="game.exe" File="C:game.exe.dat" />)"},
        {"DirectoryChanges", R"(<delete Path="..." />)"},
        {"DirectoryChanges", R"(<delete Path="" />)"},
        {"DirectoryChanges", R"(<new Path="a:stream" />)"},
        {"DirectoryChanges", R"(<new Path="sub\.. \x" />)"},
    };
    for (const auto& item : hostile) {
        TestBatch batch(kInstalled, kTarget);
        const std::string info = PathJoin(batch.Root(), "patchinfo.xml");
        WriteTextFile(PathJoin(batch.Root(), "outside.txt"), "must stay");
        std::string text = ReadTextFile(info);
        WriteTextFile(info, text.insert(text.find("</" + item.first), item.second));
        for (const bool stageTwo : {false, true}) {
            SCOPED_TRACE(item.second + (stageTwo ? " in stage two" : ""));
            BatchRun run(batch);
            try {
                stageTwo ? run.Apply() : run.Prepare();
                ADD_FAILURE() << "accepted";
            } catch (const Exception& error) {
                EXPECT_EQ(error.message.find("Unsafe path"), 0u) << error.message;
            }
            EXPECT_EQ(ReadTree(batch.Installation()), kInstalled);
            EXPECT_TRUE(ReadTree(batch.PatchedFiles()).files.empty());
            EXPECT_EQ(ReadTextFile(PathJoin(batch.Root(), "outside.txt")), "must stay");
        }
    }
}

// Ends stage two right after a number of actions, as a crash would: the
// action has happened, nothing after it.
void InterruptAfter(const TestBatch& batch, int actions) {
    BatchRun run(batch);
    run.Prepare();
    run.onReport = [&actions](const std::string&) {
        if (--actions == 0) throw std::runtime_error("interrupted");
    };
    EXPECT_THROW(run.Apply(), std::runtime_error);
}

TEST(Resume, InterruptedAfterEveryActionTheNextRunFinishesTheBatch) {
    for (int k = 1; k <= kActions; ++k) {
        SCOPED_TRACE("after action " + std::to_string(k));
        TestBatch batch(kInstalled, kTarget);
        RecreateCfg(batch);
        InterruptAfter(batch, k);
        ASSERT_TRUE(PathExists(PathJoin(batch.Root(), "PPF.xml")));
        BatchRun(batch).Resume();
        EXPECT_EQ(ReadTree(batch.Installation()), kTarget);
        EXPECT_FALSE(PathExists(PathJoin(batch.Root(), "PPF.xml")));
        EXPECT_EQ(ReadTextFile(batch.VersionFile()), "2");
    }
}

// The record names the creation of "cfg", and the moves had begun: taking
// the earlier deletion of "cfg" for it would throw away what was moved in.
// A record naming no action of the batch leaves only the moves.
TEST(Resume, TheRecordedActionIsKnownByOrdinalAndPath) {
    TestBatch batch(kInstalled, kTarget);
    RecreateCfg(batch);
    InterruptAfter(batch, kActions);
    ASSERT_TRUE(MoveFileReplacing(PathJoin(batch.PatchedFiles(), "cfg\\user.ini"),
                                  PathJoin(batch.Installation(), "cfg\\user.ini")));
    BatchRun(batch).Resume();
    EXPECT_EQ(ReadTree(batch.Installation()), kTarget);

    TestBatch other(kInstalled, kTarget);
    BatchRun run(other);
    run.Prepare();
    run.progress.SetActionIndex(3);
    run.progress.SetFile("no such item");
    ASSERT_TRUE(run.progress.WriteRecord());
    BatchRun(other).Resume();
    Tree expected = kInstalled;
    for (const auto& file : kTarget.files) expected.File(file.first, file.second);
    EXPECT_EQ(ReadTree(other.Installation()).files, expected.files);
}

}  // namespace
