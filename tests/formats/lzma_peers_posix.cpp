// The peer tools live (natively, where they are installed): xz and
// Python's lzma on a few megabytes, both ways, and the ironvale-patch
// archive commands end to end.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "patch/patch_archive.h"
#include "tests/formats/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

bool Shell(const std::string& command) { return std::system(command.c_str()) == 0; }

// Text whose repeats lie further apart than the 64 KiB dictionary of the
// Python stream.
std::string PeerInput() {
    std::string data;
    uint32_t state = 99;
    while (data.size() < (3u << 20)) {
        state = state * 1664525u + 1013904223u;
        data += "block " + std::to_string(state % 5000) + (state & 1 ? " alpha\n" : " omega\n");
    }
    return data;
}

TEST(LzmaPeers, DecodesStreamsOfTheInstalledXzAndPython) {
    if (!Shell("command -v xz >/dev/null && command -v python3 >/dev/null")) GTEST_SKIP() << "xz or python3 missing";
    TempFolder folder;
    const std::string input = folder / "input.bin";
    const std::string data = PeerInput();
    WriteTextFile(input, data);
    ASSERT_TRUE(Shell("xz --format=lzma -9 -c '" + input + "' > '" + (folder / "xz.lzma") + "'"));
    ASSERT_TRUE(Shell("python3 -c 'import lzma,sys; d=open(sys.argv[1],\"rb\").read(); "
                    "open(sys.argv[2],\"wb\").write(lzma.compress(d, format=lzma.FORMAT_ALONE, "
                    "filters=[{\"id\": lzma.FILTER_LZMA1, \"dict_size\": 1 << 16, \"lc\": 1, \"lp\": 1, \"pb\": 1}]))' '" +
                    input + "' '" + (folder / "py.lzma") + "'"));
    EXPECT_EQ(DecodeToString(ReadTextFile(folder / "xz.lzma")), data);
    EXPECT_EQ(DecodeToString(ReadTextFile(folder / "py.lzma")), data);
}

TEST(LzmaPeers, XzDecodesWhatTheArchiveCommandsPack) {
    if (!Shell("command -v xz >/dev/null")) GTEST_SKIP() << "xz missing";
    TempFolder folder;
    const std::string tool = std::string(IRONVALE_BINARY_DIR) + "/tools/ironvale-patch";
    const std::string data = PeerInput();
    WriteTextFile(folder / "input.bin", data);
    WriteTextFile(folder / "empty.bin", "");
    const std::string archive = folder / "a.pak";
    ASSERT_TRUE(Shell("'" + tool + "' archive pack '" + archive + "' 'dir\\input.bin=" + (folder / "input.bin") +
                    "' 'empty.bin=" + (folder / "empty.bin") + "' > /dev/null"));
    ASSERT_TRUE(Shell("'" + tool + "' archive list '" + archive + "' > '" + (folder / "list.txt") + "'"));
    const std::string list = ReadTextFile(folder / "list.txt");
    EXPECT_NE(list.find(std::to_string(data.size()) + " "), std::string::npos) << list;
    EXPECT_NE(list.find("dir\\input.bin"), std::string::npos) << list;
    ASSERT_TRUE(Shell("'" + tool + "' archive extract '" + archive + "' 'dir\\input.bin' '" + (folder / "out.bin") + "'"));
    EXPECT_EQ(ReadTextFile(folder / "out.bin"), data);
    EXPECT_FALSE(Shell("'" + tool + "' archive extract '" + archive + "' nope '" + (folder / "x") + "' 2>/dev/null"));

    // The member's data is a stand-alone stream that xz reads as it stands.
    FileStream file;
    file.Open(archive);
    ArchiveMember member;
    ASSERT_TRUE(ReadArchiveMember(file, 0, file.GetLength(), member));
    file.Close();
    WriteTextFile(folder / "member.lzma", ReadTextFile(archive).substr(member.dataOffset, member.dataSize));
    ASSERT_TRUE(Shell("xz --format=lzma -dc '" + (folder / "member.lzma") + "' > '" + (folder / "xz.bin") + "'"));
    EXPECT_EQ(ReadTextFile(folder / "xz.bin"), data);
}

}  // namespace
