// The update's small rules: version texts, the history line and what the
// clean-up leaves.
#include <gtest/gtest.h>

#include <tuple>

#include "app/temporary_files.h"
#include "app/update_history.h"
#include "app/version_text.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

TEST(VersionText, OlderFirstWordAndFolderNames) {
    const std::tuple<const char*, const char*, bool> older[] = {
        {"9", "10", true},       {"10", "9", false}, {"999", "1000", true},  {"1000", "999", false},
        {"007", "7", false},     {"2", "2", false},  {"1.9", "1.10", false},  // not whole numbers: byte-wise
        {"beta", "gamma", true}, {"10", "9a", true}, {"", "1", true},
    };
    for (const auto& [installed, latest, expected] : older) {
        EXPECT_EQ(IsOlderVersion(installed, latest), expected) << installed << " < " << latest;
    }
    EXPECT_EQ(FirstWord("  \t\r\n12 and more"), "12");
    EXPECT_EQ(FirstWord("7"), "7");
    EXPECT_EQ(FirstWord(" \n"), "");
    EXPECT_EQ(PatchName(kPatchBaseVersion, "4"), "patch_515195_4");
    EXPECT_EQ(BuildName("4"), "build_4");
}

TEST(UpdateHistory, OneLineWithoutLeadingZerosEndedByCrLf) {
    EXPECT_EQ(FormatHistoryLine({2011, 3, 7, 9, 5, 2, 40}, "http://host/patch_515195_2"),
              "2011-3-7 9:5:2.40 http://host/patch_515195_2\r\n");
}

TEST(TemporaryFiles, GoWithTheWorkFolderButNothingElse) {
    TempFolder temp;
    const std::string work = temp / "tempPatch";
    WriteTree(work, TreeOf("patched/a/b.bin=x|patch0.lzma=|Patch1.LZMA=|patchinfo.xml=|diffTempFile.dz=|tmp_1=|"
                           "keep.txt=mine"));
    CleanTemporaryFiles(work, PathJoin(work, "patched"));
    EXPECT_EQ(ReadTree(work), TreeOf("keep.txt=mine"));
    RemoveFile(PathJoin(work, "keep.txt"));
    CleanTemporaryFiles(work, PathJoin(work, "patched"));
    EXPECT_FALSE(FileExists(work));
}

}  // namespace
