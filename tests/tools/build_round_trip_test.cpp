// Patches and complete builds made by the publisher's builder, applied by
// the updater's own applier, must turn the old tree into the new one.
#include <gtest/gtest.h>

#include <filesystem>

#include "base/paths.h"
#include "tests/support/test_files.h"
#include "tests/tools/tree_maker.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/patch_verifier.h"

namespace {

std::string JoinLines(const std::vector<std::string>& lines) {
    std::string text;
    for (const std::string& line : lines) text += line + "\n";
    return text;
}

struct RoundTripCase {
    uint32_t seed;
    int64_t maxArchiveSize;
};

class RoundTrip : public testing::TestWithParam<RoundTripCase> {};

TEST_P(RoundTrip, PatchTurnsOldTreeIntoNewTree) {
    if (!CanRunXdelta3()) GTEST_SKIP() << "the xdelta3 program cannot be run here (deltas are made natively)";
    TempFolder temp;
    MakeRandomTree(GetParam().seed, temp / "old");
    MakeNextVersion(GetParam().seed, temp / "old", temp / "new");
    BuildOptions options;
    options.fromDir = temp / "old";
    options.toDir = temp / "new";
    options.version = "2";
    options.outDir = temp / "out";
    options.maxArchiveSize = GetParam().maxArchiveSize;
    const std::string patch = BuildPatch(options);
    EXPECT_EQ(PathJoin(temp / "out", "patch_515195_2"), patch);
    EXPECT_EQ("", JoinLines(VerifyPatch(patch, temp / "old", temp / "new")));
    // Nothing of the build's own work is left beside the result.
    std::vector<std::string> entries;
    for (const auto& entry : std::filesystem::directory_iterator(temp / "out")) {
        entries.push_back(entry.path().filename().string());
    }
    EXPECT_EQ(std::vector<std::string>{"patch_515195_2"}, entries);
}

// Small archive limits split the members over many archives.
INSTANTIATE_TEST_SUITE_P(Seeds, RoundTrip,
                         testing::Values(RoundTripCase{1, 64 << 20}, RoundTripCase{2, 64 << 20}, RoundTripCase{3, 4096},
                                         RoundTripCase{4, 1}, RoundTripCase{5, 64 << 20}, RoundTripCase{6, 20000}));

TEST(CompleteBuild, AppliedToAnEmptyFolderGivesTheTree) {
    for (uint32_t seed : {11u, 12u}) {
        TempFolder temp;
        MakeRandomTree(seed, temp / "game");
        MakeNextVersion(seed, temp / "game", temp / "game2");
        std::filesystem::create_directories(temp / "empty");
        BuildOptions options;
        options.toDir = temp / "game2";
        options.version = "2.0.1";
        options.outDir = temp / "out";
        options.maxArchiveSize = 10000;
        const std::string build = BuildPatch(options);
        EXPECT_EQ(PathJoin(temp / "out", "build_2.0.1"), build);
        EXPECT_EQ("", JoinLines(VerifyPatch(build, temp / "empty", temp / "game2"))) << "seed " << seed;
    }
}

// The round trips above are only worth something if verify sees a wrong
// result: compare a build's result with trees that differ from it.
TEST(Verify, ListsEveryDifferenceFromTheExpectedTree) {
    TempFolder temp;
    for (const char* folder : {"game/data/maps", "game/docs", "empty"})
        std::filesystem::create_directories(temp / folder);
    WriteTextFile(temp / "game/data/maps/a.map", "map a");
    WriteTextFile(temp / "game/docs/readme.txt", "read me");
    WriteTextFile(temp / "game/top.txt", "top");
    BuildOptions options;
    options.toDir = temp / "game";
    options.version = "4";
    options.outDir = temp / "out";
    const std::string build = BuildPatch(options);
    ASSERT_EQ("", JoinLines(VerifyPatch(build, temp / "empty", temp / "game")));

    std::filesystem::copy(temp / "game", temp / "other", std::filesystem::copy_options::recursive);
    WriteTextFile(temp / "other/top.txt", "tip");
    std::filesystem::remove_all(temp / "other/docs");
    std::filesystem::create_directories(temp / "other/saves");
    WriteTextFile(temp / "other/data/extra.pak", "x");
    EXPECT_EQ(
        "missing folder: saves\n"
        "unexpected folder: docs\n"
        "missing file: data\\extra.pak\n"
        "different content: top.txt\n"
        "unexpected file: docs\\readme.txt\n",
        JoinLines(VerifyPatch(build, temp / "empty", temp / "other")));
}

TEST(Determinism, TwoBuildsOfTheSameInputAreIdentical) {
    const bool patches = CanRunXdelta3();
    TempFolder temp;
    MakeRandomTree(21, temp / "old");
    MakeNextVersion(21, temp / "old", temp / "new");
    for (const char* out : {"first", "second"}) {
        BuildOptions options;
        options.toDir = temp / "new";
        options.version = "7";
        options.outDir = temp / out;
        options.maxArchiveSize = 30000;
        BuildPatch(options);
        if (patches) {
            options.fromDir = temp / "old";
            BuildPatch(options);
        }
    }
    EXPECT_EQ("", JoinLines(CompareTrees(temp / "second", temp / "first")));
}

}  // namespace
