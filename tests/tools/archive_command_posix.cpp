// The ironvale-patch archive commands end to end, with the installed xz
// reading what they pack (natively, where xz is installed).
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "patch/patch_archive.h"
#include "tests/support/test_files.h"

namespace {

bool Shell(const std::string& command) { return std::system(command.c_str()) == 0; }

// A megabyte of text with repeats near and far.
std::string PeerInput() {
    std::string data;
    uint32_t state = 99;
    while (data.size() < (1u << 20)) {
        state = state * 1664525u + 1013904223u;
        data += "block " + std::to_string(state % 5000) + (state & 1 ? " alpha\n" : " omega\n");
    }
    return data;
}

TEST(ArchiveCommand, PacksListsAndExtractsWhatXzAlsoReads) {
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
    ASSERT_TRUE(
        Shell("'" + tool + "' archive extract '" + archive + "' 'dir\\input.bin' '" + (folder / "out.bin") + "'"));
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
