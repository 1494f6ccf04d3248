#include "app/overall_progress.h"

#include <gtest/gtest.h>

TEST(OverallProgress, CompleteArchivesFillTheirSharesAndTheCurrentOneItsPart) {
    const struct {
        int32_t done, total;
        uint32_t bytesDone, bytesTotal;
        int32_t expected;
    } cases[] = {
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
    for (const auto& c : cases) {
        EXPECT_EQ(OverallProgress(c.done, c.total, c.bytesDone, c.bytesTotal), c.expected) << c.done << "/" << c.total;
    }
}
