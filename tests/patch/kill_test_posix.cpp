#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <random>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/patch/stage_two_fixture.h"
#include "tests/support/test_files.h"

namespace {

// Runs stage two of batch in a child process; the child's exit status is 0
// when the batch finished.
pid_t StartStageTwo(const StageTwoBatch& batch) {
    const pid_t child = fork();
    if (child == 0) {
        int status = 1;
        try {
            status = RunStageTwo(batch, nullptr) ? 0 : 1;
        } catch (const Exception&) {
        }
        _exit(status);
    }
    return child;
}

int Finish(pid_t child) {
    int status = 0;
    waitpid(child, &status, 0);
    return status;
}

// Stage two is killed (SIGKILL, no chance to clean up) at seeded random
// moments, then a fresh process resumes: every time the installation must
// end as the target, with no record left.
TEST(KillTest, StageTwoKilledAtRandomMomentsAlwaysResumesToTheTarget) {
    std::chrono::microseconds fullRun{0};
    {
        TempFolder root;
        const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
        const auto start = std::chrono::steady_clock::now();
        ASSERT_EQ(Finish(StartStageTwo(batch)), 0);
        fullRun = std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - start);
    }
    std::mt19937 random(20261206);
    std::uniform_int_distribution<long> moment(0, fullRun.count());
    const int kTrials = 200;
    int killedMidway = 0;
    for (int trial = 0; trial < kTrials; ++trial) {
        TempFolder root;
        const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
        const pid_t victim = StartStageTwo(batch);
        usleep(static_cast<useconds_t>(moment(random)));
        kill(victim, SIGKILL);
        const int status = Finish(victim);
        if (WIFSIGNALED(status)) ++killedMidway;
        ASSERT_EQ(Finish(StartStageTwo(batch)), 0) << "trial " << trial;
        ASSERT_EQ(ListTree(batch.installation), ExpectedTree()) << "trial " << trial;
        ASSERT_FALSE(PathExists(PathJoin(batch.installation, "PPF.xml"))) << "trial " << trial;
        ASSERT_FALSE(PathExists(PathJoin(batch.installation, "_PPF.xml"))) << "trial " << trial;
        ASSERT_EQ(ReadTextFile(PathJoin(batch.installation, kVersionFile)), "2") << "trial " << trial;
    }
    std::printf("kill points tried: %d (stage two killed before its end: %d; a full run takes %ld us)\n", kTrials,
                killedMidway, static_cast<long>(fullRun.count()));
    EXPECT_GT(killedMidway, kTrials / 4);
}

}  // namespace
