#include "app/overall_progress.h"

#include <gtest/gtest.h>

#include <tuple>

TEST(OverallProgress, CompleteArchivesFillTheirSharesAndTheCurrentOneItsPart) {
    // Archives done and in all, bytes of the current one fetched and in all; the progress in thousandths.
    const std::tuple<int32_t, int32_t, uint32_t, uint32_t, int32_t> cases[] = {
        {2, 4, 300, 600, 625},  // second of four complete, third half fetched
        {0, 4, 0, 600, 0},
        {4, 4, 0, 0, 1000},   // after the last archive
        {0, 0, 5, 10, 1000},  // nothing to fetch counts as complete
        {0, 3, 1, 2, 166},    // the share is truncated, not rounded
        {1, 3, 0, 0, 333},    // no total known: no share
        {1, 3, 999, 1000, 666},
        // A server without a length is measured against 1 MiB; a larger
        // file must not run into the next archive's share or past 1000.
        {1, 4, 3000000, 1048576, 500},
        {3, 3, 5, 10, 1000},
    };
    for (const auto& [done, total, bytesDone, bytesTotal, expected] : cases) {
        EXPECT_EQ(OverallProgress(done, total, bytesDone, bytesTotal), expected) << done << "/" << total;
    }
}
