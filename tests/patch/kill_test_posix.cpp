// Stage two of a real process killed outright (SIGKILL, no chance to clean
// up) at seeded moments, then finished by the next run from its record.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <random>

#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

// Stage two of a prepared run in a child process, killed after a while
// unless that is negative; the child's wait status.
int StageTwoInAChild(BatchRun& run, long killAfterMicroseconds) {
    const pid_t child = fork();
    if (child == 0) {
        try {
            run.Apply();
            _exit(0);
        } catch (...) {
            _exit(1);
        }
    }
    if (killAfterMicroseconds >= 0) usleep(static_cast<useconds_t>(killAfterMicroseconds));
    if (killAfterMicroseconds >= 0) kill(child, SIGKILL);
    int status = 0;
    waitpid(child, &status, 0);
    return status;
}

TEST(Kill, StageTwoKilledAtSeededMomentsIsFinishedByTheNextRun) {
    const Tree installed = RandomTree(7);
    const Tree target = NextVersion(installed, 7);
    const TestBatch timed(installed, target);
    BatchRun full(timed);
    full.Prepare();
    const auto start = std::chrono::steady_clock::now();
    ASSERT_EQ(StageTwoInAChild(full, -1), 0);
    const auto duration =
        std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - start);
    std::mt19937 random(20261206);
    int killedMidway = 0;
    for (int trial = 0; trial < 6; ++trial) {
        TestBatch batch(installed, target);
        BatchRun run(batch);
        run.Prepare();
        killedMidway += WIFSIGNALED(StageTwoInAChild(run, random() % duration.count())) ? 1 : 0;
        BatchRun(batch).Resume();
        EXPECT_EQ(ReadTree(batch.Installation()), target) << "trial " << trial;
        EXPECT_FALSE(PathExists(PathJoin(batch.Root(), "PPF.xml")) || PathExists(PathJoin(batch.Root(), "_PPF.xml")));
        EXPECT_EQ(ReadTextFile(batch.VersionFile()), "2");
    }
    EXPECT_GT(killedMidway, 0);
}

}  // namespace
