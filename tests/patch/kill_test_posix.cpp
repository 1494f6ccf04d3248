// Stage two of a real process killed (SIGKILL) at seeded moments, then
// finished by the next run from its record.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <random>

#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

TEST(Kill, StageTwoKilledAtSeededMomentsIsFinishedByTheNextRun) {
    const Tree installed = RandomTree(7);
    const Tree target = NextVersion(installed, 7);
    std::mt19937 random(20261206);
    long fullRun = 0;  // microseconds, measured on the first run, which is not killed
    int killedMidway = 0;
    for (int trial = 0; trial <= 6; ++trial) {
        TestBatch batch(installed, target);
        BatchRun run(batch);
        run.Prepare();
        const auto start = std::chrono::steady_clock::now();
        const pid_t child = fork();
        if (child == 0) {
            try {
                run.Apply();
                _exit(0);
            } catch (...) {
                _exit(1);
            }
        }
        if (trial > 0) usleep(static_cast<useconds_t>(random() % fullRun));
        if (trial > 0) kill(child, SIGKILL);
        int status = 0;
        waitpid(child, &status, 0);
        const auto elapsed = std::chrono::steady_clock::now() - start;
        if (trial == 0) fullRun = std::chrono::duration_cast<std::chrono::microseconds>(elapsed).count();
        killedMidway += WIFSIGNALED(status) ? 1 : 0;
        BatchRun(batch).Resume();
        const bool done = ReadTextFile(batch.VersionFile()) == "2" && ReadTree(batch.Installation()) == target;
        const bool untouched = ReadTextFile(batch.VersionFile()) == "1" && ReadTree(batch.Installation()) == installed;
        EXPECT_TRUE(done || untouched) << "trial " << trial;
        EXPECT_FALSE(PathExists(PathJoin(batch.Root(), "PPF.xml")) || PathExists(PathJoin(batch.Root(), "_PPF.xml")));
    }
    EXPECT_GT(killedMidway, 0);
}

}  // namespace
