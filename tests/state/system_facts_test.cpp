#include "state/system_facts.h"

#include <gtest/gtest.h>

#include "tests/support/test_files.h"

namespace {

TEST(SystemFactsTest, OsNamesFollowTheVersionTable) {
    struct Case {
        uint32_t major;
        uint32_t minor;
        const char* name;
    };
    const Case cases[] = {
        {3, 3, "WindowsNT351"},
        {3, 51, "UnknownVersion"},
        {4, 0, "Windows95"},
        {4, 10, "Windows98"},
        {4, 90, "WindowsME"},
        {5, 0, "Windows2000"},
        {5, 1, "XP"},
        {5, 2, "Server2003"},
        {6, 0, "Vista"},
        {6, 1, "Windows7"},
        {6, 2, "UnknownVersion"},
        {6, 3, "UnknownVersion"},
        {10, 0, "UnknownVersion"},
        {0, 0, "UnknownVersion"},
        {1, 6, "UnknownVersion"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(OsNameForVersion(c.major, c.minor), c.name) << c.major << "." << c.minor;
    }
    EXPECT_TRUE(IsWindows7("Windows7"));
    EXPECT_FALSE(IsWindows7("windows7"));
    EXPECT_FALSE(IsWindows7("Windows7 "));
}

TEST(SystemFactsTest, DetectionRunsOnce) {
    OsInfo detected{true, "Server2003"};
    DetectOsName(detected);
    EXPECT_EQ(detected.osName, "Server2003");

    OsInfo fresh;
    DetectOsName(fresh);
    EXPECT_TRUE(fresh.detected);
    EXPECT_FALSE(fresh.osName.empty());
}

TEST(SystemFactsTest, SidTextForms) {
    struct Case {
        std::array<uint8_t, 6> authority;
        std::vector<uint32_t> subAuthorities;
        const char* text;
    };
    const Case cases[] = {
        {{0, 0, 0, 0, 0, 5},
         {21, 1004336348, 1177238915, 682003330, 512},
         "S-1-5-21-1004336348-1177238915-682003330-512"},
        {{0, 0, 0, 0, 0, 22}, {1, 1000}, "S-1-22-1-1000"},
        {{0, 0, 0, 0, 0, 1}, {0}, "S-1-1-0"},
        {{0, 0, 0, 0, 0, 5}, {}, "S-1-5"},
        // Four low bytes in decimal, as an unsigned number.
        {{0, 0, 1, 0, 0, 0}, {7}, "S-1-16777216-7"},
        {{0, 0, 0xFF, 0xFF, 0xFF, 0xFF}, {4294967295u}, "S-1-4294967295-4294967295"},
        // Any of the two high bytes set: hexadecimal, two digits a byte.
        {{0, 1, 0, 0, 0, 0}, {2}, "S-1-0X000100000000-2"},
        {{0xAB, 0xCD, 0x0E, 0xF0, 0x01, 0x2F}, {}, "S-1-0XABCD0EF0012F"},
    };
    for (const Case& c : cases) EXPECT_EQ(FormatSid(c.authority, c.subAuthorities), c.text);
}

TEST(SystemFactsTest, FileExistsForFilesAndFolders) {
    TempFolder folder;
    WriteTextFile(folder / "file.txt", "x");
    EXPECT_TRUE(FileExists(folder / "file.txt"));
    EXPECT_TRUE(FileExists(folder.Path()));
    EXPECT_FALSE(FileExists(folder / "missing.txt"));
    EXPECT_FALSE(FileExists(""));
}

}  // namespace
