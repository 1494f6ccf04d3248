// The update's small rules: version texts, the progress of the whole
// download, the history line and what the clean-up leaves.
#include <gtest/gtest.h>

#include <tuple>

#include "app/overall_progress.h"
#include "app/temporary_files.h"
#include "app/update_history.h"
#include "app/version_text.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "base/version_order.h"
#include "tests/support/batch_fixture.h"

namespace {

TEST(VersionText, FirstWord) {
    EXPECT_EQ(FirstWord("  \t\r\n12 and more"), "12");
    EXPECT_EQ(FirstWord(" \n"), "");
    EXPECT_EQ(FirstWord("\xEF\xBB\xBF 3\r\n"), "3");
}

TEST(OverallProgress, CompleteArchivesFillTheirSharesAndTheCurrentOneItsPart) {
    // Archives done and in all, bytes of the current one fetched and in all; the progress in thousandths.
    const std::tuple<int32_t, int32_t, uint32_t, uint32_t, int32_t> cases[] = {
        {2, 4, 300, 600, 625},  // second of four complete, third half fetched
        {4, 4, 0, 0, 1000},     // after the last archive
        {0, 0, 5, 10, 1000},    // nothing to fetch counts as complete
        {0, 3, 1, 2, 166},      // the share is truncated, not rounded
        {1, 3, 0, 0, 333},      // no total known: no share
        // A server without a length is measured against 1 MiB; a larger
        // file must not run into the next archive's share or past 1000.
        {1, 4, 3000000, 1048576, 500},
        {3, 3, 5, 10, 1000},
    };
    for (const auto& [done, total, bytesDone, bytesTotal, expected] : cases) {
        EXPECT_EQ(OverallProgress(done, total, bytesDone, bytesTotal), expected) << done << "/" << total;
    }
}

TEST(UpdateHistory, OneLineWithoutLeadingZerosEndedByCrLf) {
    EXPECT_EQ(FormatHistoryLine({2011, 3, 7, 9, 5, 2, 40}, "http://host/patch_515195_2"),
              "2011-3-7 9:5:2.40 http://host/patch_515195_2\r\n");
}

// Archives the downloader keeps for a later run stay until the clean-up is told otherwise.
TEST(TemporaryFiles, GoWithTheWorkFolderButNothingElse) {
    TempFolder temp;
    const std::string work = temp / "tempPatch";
    WriteTree(work, TreeOf("patched/a/b.bin=x|patch0.lzma=|Patch1.LZMA=|patchinfo.xml=|diffTempFile.dz=|tmp_1=|"
                           "keep.txt=mine|download-records/Patch1.LZMA=record"));
    CleanTemporaryFiles(work, PathJoin(work, "patched"), true);
    EXPECT_EQ(ReadTree(work), TreeOf("Patch1.LZMA=|keep.txt=mine|download-records/Patch1.LZMA=record"));
    CleanTemporaryFiles(work, PathJoin(work, "patched"));
    EXPECT_EQ(ReadTree(work), TreeOf("keep.txt=mine"));
    EXPECT_TRUE(RemoveFile(PathJoin(work, "keep.txt")));
    CleanTemporaryFiles(work, PathJoin(work, "patched"));
    EXPECT_FALSE(FileExists(work));
}

}  // namespace
