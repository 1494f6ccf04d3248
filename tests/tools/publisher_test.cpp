// Patches and complete builds made by the publisher's builder, applied by the updater's own stages (VerifyPatch).
#include <gtest/gtest.h>

#include <filesystem>
#include <tuple>

#include "base/exception.h"
#include "base/paths.h"
#include "net/signature_formats.h"
#include "patch/patch_info_file.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/delta_maker.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/patch_verifier.h"
#include "tools/publisher/signing_key.h"

namespace {

using Lines = std::vector<std::string>;

// Seed, archive size limit (small ones spread the members over many archives), and whether it is a complete build,
// applied to an empty folder.
class RoundTrip : public testing::TestWithParam<std::tuple<unsigned, int64_t, bool>> {};

TEST_P(RoundTrip, TheAppliedPatchTurnsTheOldTreeIntoTheNewOne) {
    const auto [seed, maxArchiveSize, complete] = GetParam();
    if (!complete && !IsXdelta3Available()) GTEST_SKIP() << "xdelta3 cannot be started here";
    TempFolder temp;
    const Tree old = complete ? Tree() : RandomTree(seed);
    const Tree next = NextVersion(RandomTree(seed), seed);
    WriteTree(temp / "old", old);
    WriteTree(temp / "new", next);
    BuildOptions options{complete ? "" : temp / "old", temp / "new", "2", temp / "out", maxArchiveSize};
    const std::string patch = BuildPatch(options);
    EXPECT_EQ(VerifyPatch(patch, temp / "old", temp / "new"), Lines());
    // Nothing of the build's own work is left beside the result.
    const std::filesystem::directory_iterator out(temp / "out");
    EXPECT_EQ(std::distance(out, std::filesystem::directory_iterator()), 1);
    options.outDir = temp / "again";  // the same input gives the same bytes
    EXPECT_EQ(CompareTrees(BuildPatch(options), patch), Lines());

    // The updater is told of room for the archives and every file it writes.
    PatchInfoFile info;
    info.Load(PathJoin(patch, "patchinfo.xml"));
    int64_t written = 0;
    for (const auto& file : ReadTree(patch).files) written += file.first == "patchinfo.xml" ? 0 : file.second.size();
    for (const auto& [path, content] : next.files) {
        if (old.files.count(path) == 0 || old.files.at(path) != content) written += content.size();
    }
    EXPECT_GE(info.GetSpaceRequirement(), written);
    EXPECT_EQ(info.GetVersion(), "2");  // where it leads, against replays
}

INSTANTIATE_TEST_SUITE_P(Seeds, RoundTrip,
                         testing::Values(std::make_tuple(1u, int64_t{64 << 20}, false),
                                         std::make_tuple(3u, int64_t{4096}, false),
                                         std::make_tuple(4u, int64_t{1}, false),
                                         std::make_tuple(11u, int64_t{10000}, true)));

// A key pair is written, never replaced, and read back.
TEST(Signing, KeyFilesRoundTripAndAreNeverReplaced) {
    TempFolder temp;
    const P256PrivateKey key = GenerateSigningKey();
    WriteKeyPair(temp.Path(), key);
    EXPECT_THROW(WriteKeyPair(temp.Path(), GenerateSigningKey()), Exception);
    EXPECT_EQ(PrivateKeyPem(LoadSigningKey(temp / "private.pem")), PrivateKeyPem(key));
    EXPECT_EQ(ReadPemFile(temp / "public.pem"), PublicKeyPem(key.publicKey));
}

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
