// A batch run through both stages on real folders: the result, the ways
// the stages end early, and the resume of a stage two cut short or killed.
#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <random>
#include <stdexcept>
#include <thread>
#include <tuple>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/child_process.h"

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
const int kActions = 17;  // 5 files deleted, 4 folders deleted (cfg too), 8 created (cfg too)

TEST(StageOne, EndsEarlyWithAClearErrorAndTheInstallationUntouched) {
    const std::tuple<std::function<void(BatchRun&)>, ErrorCode, std::string> cases[] = {
        {[](BatchRun& run) { run.onReport = [&run](const std::string&) { run.applier.RequestCancel(); }; },
         ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Cancelled; }, ErrorCode::UserCancelled, ""},
        {[](BatchRun& run) { run.state = ArchiveState::Failed; }, ErrorCode::FileNotFound,
         "Failed to download patch file."},
        {[](BatchRun& run) { run.state = ArchiveState::Corrupt; }, ErrorCode::CorruptData, "The patch archive "},
        {[](BatchRun& run) { RemoveFile(PathJoin(run.work.installationFolder, "game.exe")); }, ErrorCode::DeltaFailed,
         "Failed to apply delta file "},
    };
    for (const auto& [cause, code, message] : cases) {  // message: how it starts
        SCOPED_TRACE(static_cast<int>(code));
        TestBatch batch(kInstalled, kTarget);
        BatchRun run(batch);
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

// Ends stage two after some actions, as a crash would. "cfg" is deleted and
// then created anew as the last action: one path, two actions.
void InterruptAfter(TestBatch& batch, int actions) {
    batch.description.deletedDirectories.push_back("cfg");
    batch.description.newDirectories.push_back("cfg");
    batch.WriteInfo();
    BatchRun run(batch);
    run.Prepare();
    run.onReport = [&actions](const std::string&) {
        if (--actions == 0) throw std::runtime_error("interrupted");
    };
    EXPECT_THROW(run.Apply(), std::runtime_error);
}

// The record names the creation of "cfg", and the moves had begun: taking
// the earlier deletion of "cfg" for it would throw away what was moved in.
TEST(Resume, TheRecordedActionIsKnownByOrdinalAndPath) {
    TestBatch batch(kInstalled, kTarget);
    InterruptAfter(batch, kActions);
    ASSERT_TRUE(MoveFileReplacing(PathJoin(batch.PatchedFiles(), "cfg\\user.ini"),
                                  PathJoin(batch.Installation(), "cfg\\user.ini")));
    BatchRun(batch).Resume();
    EXPECT_EQ(ReadTree(batch.Installation()), kTarget);
}

// Stage two in a process of its own, run whole once and then killed at
// seeded moments (SIGKILL natively, TerminateProcess under Wine), then the
// next start: the batch is finished to exactly the target, or it had not
// begun and the old installation stands.
TEST(Kill, StageTwoKilledAtSeededMomentsIsFinishedByTheNextStart) {
    std::mt19937 random(20261206);
    long long fullRun = 0;  // microseconds, measured on the first run, which is not killed
    int killed = 0;
    for (int trial = 0; trial <= 6; ++trial) {
        TestBatch batch(kInstalled, kTarget);
        // A longer file left by an earlier attempt must not keep its tail.
        WriteTree(batch.PatchedFiles(), Tree().File("a.bin", SeededBytes(100000, 3)));
        BatchRun(batch).Prepare();
        const auto start = std::chrono::steady_clock::now();
        ChildProcess child(TestProgramPath("stage_two_child"), {batch.Root()});
        if (trial > 0) {
            std::this_thread::sleep_for(std::chrono::microseconds(random() % fullRun));
            child.Kill();
        }
        const int code = child.Wait();
        if (trial == 0) {
            ASSERT_EQ(code, 0);
            fullRun =
                std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - start).count();
        }
        killed += code == 0 ? 0 : 1;
        BatchRun(batch).Resume();
        const std::string version = ReadTextFile(batch.VersionFile());
        const Tree now = ReadTree(batch.Installation());
        EXPECT_TRUE((version == "2" && now == kTarget) || (version == "1" && now == kInstalled)) << "trial " << trial;
        EXPECT_FALSE(PathExists(PathJoin(batch.Root(), "PPF.xml")) || PathExists(PathJoin(batch.Root(), "_PPF.xml")));
    }
    EXPECT_GT(killed, 0);
}

}  // namespace
