#include <gtest/gtest.h>

#include "base/paths.h"
#include "tests/support/test_files.h"

namespace {

std::string Native(std::string path) {
    for (char& c : path) {
        if (c == '\\') c = kPathSeparator;
    }
    return path;
}

TEST(PathJoinTest, JoinsByTheOneRule) {
    struct Case {
        const char* base;
        const char* tail;
        char separator;
        const char* expected;
    } cases[] = {
        {"C:/Games/", "/data\\x.bin", '\\', "C:\\Games\\data\\x.bin"},
        {"", "a", '\\', "\\a"},
        {"dir", "", '\\', "dir\\"},
        {"a\\\\", "\\\\b", '\\', "a\\b"},
        {"http://host/base\\", "sub/file", '/', "http://host/base/sub/file"},
        {"\\\\server\\share", "x/y", '\\', "\\\\server\\share\\x\\y"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(PathJoin(c.base, c.tail, c.separator), c.expected) << c.base << " + " << c.tail;
    }
    EXPECT_EQ(PathJoin("game", "data\\x.bin"), Native("game\\data\\x.bin"));
}

TEST(PathPartsTest, ParentAndFileName) {
    EXPECT_EQ(GetParentDirectory("a/b/c.txt"), Native("a\\b"));
    EXPECT_EQ(GetParentDirectory("c.txt"), "");
    EXPECT_EQ(GetFileName("a/b\\c.txt"), "c.txt");
    EXPECT_EQ(GetFileName("c.txt"), "c.txt");
    EXPECT_EQ(GetFileName("dir\\"), "");
}

TEST(FoldersTest, TempDirectoryEndsWithASeparatorAndExists) {
    const std::string temp = GetTempDirectory();
    ASSERT_FALSE(temp.empty());
    EXPECT_TRUE(temp.back() == '/' || temp.back() == '\\');
    EXPECT_TRUE(PathExists(temp));
}

TEST(FoldersTest, MakeAndDeleteDirectories) {
    TempFolder folder;
    const std::string deep = PathJoin(folder.Path(), "a\\b\\c");
    EXPECT_TRUE(MakeDirectories(deep));
    EXPECT_TRUE(MakeDirectories(deep));  // already there
    WriteTextFile(PathJoin(deep, "f.txt"), "x");
    const std::string top = PathJoin(folder.Path(), "a");
    EXPECT_FALSE(DeleteDirectory(top, false));  // not empty
    EXPECT_TRUE(PathExists(top));
    EXPECT_TRUE(DeleteDirectory(top, true));
    EXPECT_FALSE(PathExists(top));
    EXPECT_FALSE(DeleteDirectory("", true));
}

}  // namespace
