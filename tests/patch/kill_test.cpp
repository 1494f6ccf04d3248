// Stage two in a process of its own, killed at seeded moments (SIGKILL
// natively, TerminateProcess under Wine), then the next start: the batch is
// finished, or it had not begun and the old installation stands.
#include <gtest/gtest.h>

#include <chrono>
#include <random>
#include <thread>

#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/child_process.h"

namespace {

TEST(Kill, StageTwoKilledAtSeededMomentsIsFinishedByTheNextStart) {
    const Tree installed = RandomTree(7);
    const Tree target = NextVersion(installed, 7);
    std::mt19937 random(20261206);
    long long fullRun = 0;  // microseconds, measured on the first run, which is not killed
    int killed = 0;
    for (int trial = 0; trial <= 6; ++trial) {
        TestBatch batch(installed, target);
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
        EXPECT_TRUE((version == "2" && now == target) || (version == "1" && now == installed)) << "trial " << trial;
        EXPECT_FALSE(PathExists(PathJoin(batch.Root(), "PPF.xml")) || PathExists(PathJoin(batch.Root(), "_PPF.xml")));
    }
    EXPECT_GT(killed, 0);
}

}  // namespace
