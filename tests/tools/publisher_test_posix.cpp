// The publisher's tool where POSIX is needed: the archive commands with xz, keys and signatures with OpenSSL's command
// line, and names a POSIX file system allows but a patch cannot carry to Windows.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <string>
#include <tuple>

#include "tests/support/batch_fixture.h"
#include "tools/publisher/patch_builder.h"

namespace {

bool Shell(const std::string& command) { return std::system(command.c_str()) == 0; }

TEST(ArchiveCommand, PacksListsAndExtractsWhatXzAlsoReads) {
    if (!Shell("command -v xz >/dev/null")) GTEST_SKIP() << "xz missing";
    TempFolder folder;
    std::string data;  // a megabyte of text with repeats near and far
    for (uint32_t i = 0; data.size() < (1u << 20); ++i) data += std::to_string(i * 2654435761u % 5000) + " alpha\n";
    WriteTextFile(folder / "input.bin", data);
    const std::string tool = "'" + std::string(IRONVALE_BINARY_DIR) + "/tools/ironvale-patch' archive ";
    const std::string archive = "'" + (folder / "a.pak") + "' ";
    ASSERT_TRUE(Shell(tool + "pack " + archive + "'dir\\input.bin=" + (folder / "input.bin") + "' > /dev/null"));
    ASSERT_TRUE(Shell(tool + "list " + archive + "> '" + (folder / "list.txt") + "'"));
    const std::string list = ReadTextFile(folder / "list.txt");
    EXPECT_NE(list.find(std::to_string(data.size()) + " "), std::string::npos) << list;
    EXPECT_NE(list.find("dir\\input.bin"), std::string::npos) << list;
    ASSERT_TRUE(Shell(tool + "extract " + archive + "'dir\\input.bin' '" + (folder / "out.bin") + "'"));
    EXPECT_EQ(ReadTextFile(folder / "out.bin"), data);
    EXPECT_FALSE(Shell(tool + "extract " + archive + "nope '" + (folder / "x") + "' 2>/dev/null"));

    // The member's data (after its name's length, its name and a 40-bit size) is a stream that xz reads as it stands.
    ASSERT_TRUE(Shell("tail -c +20 " + archive + "| xz --format=lzma -dc > '" + (folder / "xz.bin") + "'"));
    EXPECT_EQ(ReadTextFile(folder / "xz.bin"), data);
}

// Our keys and signatures are OpenSSL's, both ways; check sees a damaged archive.
TEST(SigningCommands, KeysAndSignaturesInteroperateWithOpenssl) {
    if (!Shell("command -v openssl >/dev/null")) GTEST_SKIP() << "openssl missing";
    TempFolder temp;
    WriteTree(temp / "new", TreeOf("data/a.txt=alpha|b.txt=beta"));
    const std::string tool =
        "cd '" + temp.Path() + "' && '" + std::string(IRONVALE_BINARY_DIR) + "/tools/ironvale-patch' ";
    ASSERT_TRUE(Shell(tool + "keygen --out keys > /dev/null"));
    ASSERT_TRUE(
        Shell(tool + "build --complete --to new --version 2 --out out --sign-key keys/private.pem 2> /dev/null"));
    EXPECT_TRUE(Shell("cd '" + temp.Path() +
                      "' && openssl dgst -sha256 -verify keys/public.pem -signature out/build_2/patchinfo.xml.sig "
                      "out/build_2/patchinfo.xml > /dev/null"));
    EXPECT_TRUE(Shell(tool + "check out/build_2 --public-key keys/public.pem > /dev/null"));
    // A SEC1 key (`openssl genpkey` writes PKCS#8, as the tests' own keys are made).
    ASSERT_TRUE(Shell("cd '" + temp.Path() +
                      "' && openssl ecparam -name prime256v1 -genkey -noout -out k.pem && openssl pkey -in k.pem "
                      "-pubout -out k.pub"));
    EXPECT_TRUE(Shell(tool + "sign --key k.pem out/build_2 > /dev/null"));
    EXPECT_TRUE(Shell(tool + "check out/build_2 --public-key k.pub > /dev/null"));
    EXPECT_FALSE(Shell(tool + "check out/build_2 --public-key keys/public.pem > /dev/null 2>&1"));
    std::string archive = ReadTextFile(temp / "out/build_2/patch0.lzma");
    archive[archive.size() / 2] ^= 0x01;
    WriteTextFile(temp / "out/build_2/patch0.lzma", archive);
    EXPECT_FALSE(Shell(tool + "check out/build_2 > /dev/null"));
}

TEST(BuildErrors, UnusableInputsFailClearlyAndLeaveNothing) {
    TempFolder temp;
    const std::string tree = temp / "tree";
    WriteTree(tree, TreeOf("sub/ok-\xC3\xA9.txt=fine"));
    std::string deep = std::string(60, 'd');
    while (deep.size() < 256) deep += "/" + std::string(60, 'd');
    // The option changed, and a folder (ending in "/") or file put into the tree for this case only.
    const std::tuple<std::string BuildOptions::*, std::string, std::string, const char*> cases[] = {
        {&BuildOptions::fromDir, temp / "nowhere", "", "Not a readable folder"},
        {&BuildOptions::toDir, temp / "nowhere", "", "Not a readable folder"},
        {&BuildOptions::xdelta3, "no-such-xdelta3-here", "", "xdelta3"},
        {&BuildOptions::version, "2 beta", "", "Not a usable version"},
        {&BuildOptions::outDir, tree + "/sub", "", "lies inside the game tree"},
        {&BuildOptions::version, "2", deep + "/", "longer than 255 bytes"},
        {&BuildOptions::version, "2", "back\\slash.txt", "backslash or colon"},
        {&BuildOptions::version, "2", "latin1-\xE9.txt", "not valid UTF-8"},
        {&BuildOptions::version, "2", "overlong-\xC0\xAF.txt", "not valid UTF-8"},
    };
    for (const auto& [field, value, entry, expected] : cases) {
        const std::string path = tree + "/" + entry;  // not PathJoin: it turns backslashes
        if (!entry.empty() && entry.back() == '/') std::filesystem::create_directories(path);
        if (!entry.empty() && entry.back() != '/') WriteTextFile(path, "bad");
        BuildOptions options{tree, tree, "2", temp / "out"};  // from, to, version, output
        options.*field = value;
        const std::string error = ErrorOf([&] { BuildPatch(options); });
        EXPECT_NE(error.find(expected), std::string::npos) << expected << ": " << error;
        EXPECT_TRUE(!PathExists(temp / "out") || std::filesystem::is_empty(temp / "out")) << expected;
        if (!entry.empty()) std::filesystem::remove_all(tree + "/" + entry.substr(0, entry.find('/')));
    }
    // A version the updater would order before the one the site publishes.
    WriteTextFile(temp / "out/version.txt", "1.10\n");
    EXPECT_THROW(BuildPatch({tree, tree, "1.9", temp / "out"}), Exception);
    EXPECT_EQ(std::filesystem::directory_iterator(temp / "out")->path().filename(), "version.txt");
}

}  // namespace
