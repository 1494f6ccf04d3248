// Patches and complete builds made by the publisher's builder, applied by
// the updater's own stages (VerifyPatch runs ApplyPatchFolder).
#include <gtest/gtest.h>

#include <filesystem>

#include "base/paths.h"
#include "patch/patch_info_file.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/delta_maker.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/patch_verifier.h"

namespace {

using Lines = std::vector<std::string>;

struct RoundTripCase {
    unsigned seed;
    int64_t maxArchiveSize;  // small limits spread the members over many archives
    bool complete;           // a complete build, applied to an empty folder
};

class RoundTrip : public testing::TestWithParam<RoundTripCase> {};

TEST_P(RoundTrip, TheAppliedPatchTurnsTheOldTreeIntoTheNewOne) {
    const RoundTripCase& test = GetParam();
    if (!test.complete && !IsXdelta3Available()) GTEST_SKIP() << "xdelta3 cannot be started here";
    TempFolder temp;
    const Tree old = test.complete ? Tree() : RandomTree(test.seed);
    const Tree next = NextVersion(RandomTree(test.seed), test.seed);
    WriteTree(temp / "old", old);
    WriteTree(temp / "new", next);
    BuildOptions options;
    options.fromDir = test.complete ? "" : temp / "old";
    options.toDir = temp / "new";
    options.version = "2";
    options.outDir = temp / "out";
    options.maxArchiveSize = test.maxArchiveSize;
    options.hive = RegistryHive::CurrentUser;
    options.registryPath = "SOFTWARE\\Studio\\Game";
    const std::string patch = BuildPatch(options);
    EXPECT_EQ(GetFileName(patch), test.complete ? "build_2" : "patch_515195_2");
    EXPECT_EQ(VerifyPatch(patch, temp / "old", temp / "new"), Lines());
    // Nothing of the build's own work is left beside the result.
    const std::filesystem::directory_iterator out(temp / "out");
    EXPECT_EQ(std::distance(out, std::filesystem::directory_iterator()), 1);
    options.outDir = temp / "again";  // the same input gives the same bytes
    EXPECT_EQ(CompareTrees(BuildPatch(options), patch), Lines());

    // What the updater is told: its registry key, and room for the
    // archives and every file it writes.
    PatchInfoFile info;
    info.Load(PathJoin(patch, "patchinfo.xml"));
    EXPECT_EQ(info.GetHive(), RegistryHive::CurrentUser);
    EXPECT_EQ(info.GetRegistryPath(), "SOFTWARE\\Studio\\Game");
    int64_t written = 0;
    for (const auto& file : ReadTree(patch).files) written += file.first == "patchinfo.xml" ? 0 : file.second.size();
    for (const auto& file : next.files) {
        written += old.files.count(file.first) && old.files.at(file.first) == file.second ? 0 : file.second.size();
    }
    EXPECT_GE(info.GetSpaceRequirement(), written);
}

INSTANTIATE_TEST_SUITE_P(Seeds, RoundTrip,
                         testing::Values(RoundTripCase{1, 64 << 20, false}, RoundTripCase{3, 4096, false},
                                         RoundTripCase{4, 1, false}, RoundTripCase{11, 10000, true}));

// The round trips mean something only if verify sees every difference.
TEST(Verify, NamesEveryKindOfDifference) {
    TempFolder temp;
    WriteTree(temp / "expected", TreeOf("data/level.pak=two|maps/north/map.dat=m|same.txt=same"));
    WriteTree(temp / "actual", TreeOf("data/level.pak=tw0|maps/|same.txt=same|junk/x.txt=x"));
    EXPECT_EQ(CompareTrees(temp / "actual", temp / "expected"),
              (Lines{"missing folder: maps\\north", "unexpected folder: junk", "different content: data\\level.pak",
                     "missing file: maps\\north\\map.dat", "unexpected file: junk\\x.txt"}));
}

}  // namespace
