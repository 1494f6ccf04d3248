// Whole batches on real folders: a patch made from two trees is prepared
// and applied, and the installation must then equal the new tree exactly.

#include <gtest/gtest.h>

#include <ostream>

#include <functional>

#include "tests/support/batch_fixture.h"

namespace {

// old with a few bytes changed in the middle and some appended.
std::string Edited(const std::string& old, unsigned seed) {
    std::string edited = old;
    for (size_t i = edited.size() / 3; i < edited.size() && i < edited.size() / 3 + 40; ++i) edited[i] ^= 0x5A;
    return edited + SeededBytes(100 + seed % 50, seed);
}

struct BatchCase {
    const char* name;
    std::function<Tree()> installed;
    std::function<Tree()> target;
    ArchiveChooser chooser;  // null: one archive for every item
};

std::string ByFirstLetter(const std::string& path) { return path[0] < 'm' ? "first.dat" : "second.dat"; }

void ExpectSameTree(const Tree& expected, const Tree& actual) {
    EXPECT_EQ(expected.folders, actual.folders);
    ASSERT_EQ(expected.files.size(), actual.files.size());
    for (const auto& file : expected.files) {
        const auto found = actual.files.find(file.first);
        ASSERT_NE(found, actual.files.end()) << file.first;
        EXPECT_TRUE(found->second == file.second) << file.first << " differs";
    }
}

const BatchCase kCases[] = {
    {"DiffNewDelete",
     [] {
         return Tree()
             .File("changed.bin", SeededBytes(200000, 1))
             .File("same.bin", SeededBytes(5000, 2))
             .File("removed.txt", "old");
     },
     [] {
         return Tree()
             .File("changed.bin", Edited(SeededBytes(200000, 1), 3))
             .File("same.bin", SeededBytes(5000, 2))
             .File("added.bin", SeededBytes(70000, 4));
     },
     nullptr},
    {"NestedFoldersCreatedAndDeleted",
     [] {
         return Tree()
             .File("data/levels/one.lvl", SeededBytes(3000, 5))
             .File("old/inner/gone.txt", "gone")
             .File("old/left.txt", "left")
             .Folder("old/empty");
     },
     [] {
         return Tree()
             .File("data/levels/one.lvl", Edited(SeededBytes(3000, 5), 6))
             .File("data/levels/deep/er/two.lvl", SeededBytes(900, 7))
             .Folder("fresh/empty/folder");
     },
     nullptr},
    {"EmptyFiles",
     [] {
         return Tree().File("grows.txt", "").File("shrinks.txt", SeededBytes(4000, 8)).File("stays-empty-gone.txt", "");
     },
     [] { return Tree().File("grows.txt", "now it has content").File("shrinks.txt", "").File("new-empty.txt", ""); },
     nullptr},
    {"NamesWithSpaces",
     [] { return Tree().File("Game Data/Sound Bank 1.bnk", SeededBytes(8000, 9)).File("Read Me.txt", "hello"); },
     [] {
         return Tree()
             .File("Game Data/Sound Bank 1.bnk", Edited(SeededBytes(8000, 9), 10))
             .File("Game Data/New Folder/Sound Bank 2.bnk", SeededBytes(1000, 11));
     },
     nullptr},
    {"ItemsSpreadOverArchivesInterleaved",
     [] {
         Tree tree;
         for (char letter : std::string("aczn")) tree.File(std::string(1, letter) + ".dat", SeededBytes(6000, letter));
         return tree;
     },
     [] {
         Tree tree;
         for (char letter : std::string("aczn")) {
             tree.File(std::string(1, letter) + ".dat", Edited(SeededBytes(6000, letter), letter));
         }
         for (char letter : std::string("bdyo")) tree.File(std::string(1, letter) + ".new", SeededBytes(700, letter));
         return tree;
     },
     ByFirstLetter},
};

// Failures name the case, not its bytes.
void PrintTo(const BatchCase& value, std::ostream* out) { *out << value.name; }

class BatchTest : public ::testing::TestWithParam<BatchCase> {};

TEST_P(BatchTest, InstallationEndsEqualToTheTarget) {
    const BatchCase& batchCase = GetParam();
    const Tree target = batchCase.target();
    const ArchiveChooser oneArchive = [](const std::string&) { return std::string("patch1.dat"); };
    TestBatch batch(batchCase.installed(), target, batchCase.chooser ? batchCase.chooser : oneArchive);
    ASSERT_NO_THROW(batch.Apply());
    ExpectSameTree(target, ReadTree(batch.Installation()));
    EXPECT_TRUE(FilesBelow(batch.PatchedFiles()).empty());
    EXPECT_FALSE(PathExists(batch.PatchFolder() + "/diffTempFile.dz"));
}

INSTANTIATE_TEST_SUITE_P(Trees, BatchTest, ::testing::ValuesIn(kCases),
                         [](const ::testing::TestParamInfo<BatchCase>& param) { return param.param.name; });

TEST(BatchReports, ManyItemsOfOneArchiveCountUpToTheWhole) {
    Tree installed;
    Tree target;
    for (int i = 0; i < 6; ++i) {
        installed.File("f" + std::to_string(i), SeededBytes(3000, i));
        target.File("f" + std::to_string(i), Edited(SeededBytes(3000, i), i));
    }
    target.File("sub/extra", "x").Folder("made");
    installed.File("doomed", "y");
    TestBatch batch(installed, target);
    ASSERT_EQ(batch.Archives().size(), 1u);
    ApplyReports reports;
    ASSERT_NO_THROW(batch.Apply(&reports));
    ExpectSameTree(target, ReadTree(batch.Installation()));

    // Six diffs, one new file, one deletion, two new folders: ten items.
    const std::vector<ApplyReports::Report> seen = reports.Reports();
    ASSERT_EQ(seen.size(), 10u);
    EXPECT_EQ(seen.front().fileName, "f0");
    EXPECT_EQ(seen.front().permille, 100);
    EXPECT_EQ(seen.back().permille, 1000);
    for (size_t i = 1; i < seen.size(); ++i) EXPECT_GT(seen[i].permille, seen[i - 1].permille);
}

TEST(BatchReports, OnlyDeletionsChangeNothingInStageOneAndReportInStageTwo) {
    TestBatch batch(Tree().File("a/one", "1").File("two", "2"), Tree());
    ApplyReports reports;
    ASSERT_NO_THROW(batch.Apply(&reports));
    EXPECT_TRUE(ReadTree(batch.Installation()).files.empty());
    EXPECT_TRUE(ReadTree(batch.Installation()).folders.empty());
    ASSERT_EQ(reports.Reports().size(), 3u);  // two files, one folder
    EXPECT_EQ(reports.Reports().back().permille, 1000);
}

// A longer file left in the patched-files folder by an earlier attempt
// must not keep its tail once the file is rebuilt over it.
TEST(BatchLeftovers, RebuiltFileOverALongerLeftoverHasNoStaleTail) {
    const std::string old = SeededBytes(2000, 20);
    const Tree target = Tree().File("x/file.bin", Edited(old, 21));
    TestBatch batch(Tree().File("x/file.bin", old), target);
    WriteTree(batch.PatchedFiles(), Tree().File("x/file.bin", SeededBytes(50000, 22)));
    ASSERT_NO_THROW(batch.Apply());
    ExpectSameTree(target, ReadTree(batch.Installation()));
}

}  // namespace
