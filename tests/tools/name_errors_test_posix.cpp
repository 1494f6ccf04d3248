// Names a POSIX file system allows but a patch cannot carry to Windows.
#include <gtest/gtest.h>

#include <filesystem>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/support/test_files.h"
#include "tools/publisher/patch_builder.h"

namespace {

// (Windows itself refuses folder paths this long to the tool's file calls.)
TEST(BuildErrors, PathsLongerThanAnArchiveNameAreRefused) {
    TempFolder temp;
    std::string relative = std::string(60, 'd');
    while (relative.size() < 256) relative += "/" + std::string(60, 'd');
    std::filesystem::create_directories(temp / ("tree/" + relative));
    BuildOptions options;
    options.toDir = temp / "tree";
    options.version = "2";
    options.outDir = temp / "out";
    try {
        BuildPatch(options);
        ADD_FAILURE() << "no exception";
    } catch (const Exception& error) {
        EXPECT_NE(std::string::npos, error.message.find("longer than 255 bytes")) << error.message;
    }
}

TEST(BuildErrors, NamesWindowsCannotHoldAreRefused) {
    const struct {
        const char* name;
        const char* expected;
    } cases[] = {
        {"back\\slash.txt", "backslash or colon"},
        {"drive:stream.txt", "backslash or colon"},
        {"latin1-\xE9.txt", "not valid UTF-8"},
        {"overlong-\xC0\xAF.txt", "not valid UTF-8"},
    };
    for (const auto& test : cases) {
        TempFolder temp;
        std::filesystem::create_directories(temp / "tree/sub");
        WriteTextFile(temp / "tree/sub/ok-\xC3\xA9.txt", "fine");
        WriteTextFile(temp / "tree/sub" + "/" + test.name, "bad");  // no PathJoin: it turns backslashes
        BuildOptions options;
        options.toDir = temp / "tree";
        options.version = "2";
        options.outDir = temp / "out";
        try {
            BuildPatch(options);
            ADD_FAILURE() << test.name << ": no exception";
        } catch (const Exception& error) {
            EXPECT_NE(std::string::npos, error.message.find(test.expected)) << error.message;
        }
    }
}

}  // namespace
