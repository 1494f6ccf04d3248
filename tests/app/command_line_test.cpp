#include <gtest/gtest.h>

#include "app/command_line.h"
#include "app/updater_arguments.h"

namespace {

using Words = std::vector<std::string>;

TEST(SplitCommandLineTest, SplitsOnBlanksAndQuotes) {
    struct Case {
        const char* text;
        Words words;
    } cases[] = {
        {"", {}},
        {" \t\r\n ", {}},
        {"a  b\tc", {"a", "b", "c"}},
        {"-hostname \"my host\" x", {"-hostname", "my host", "x"}},
        {"-SID \"\" next", {"-SID", "", "next"}},
        {"ab\"c d\"e f", {"abc de", "f"}},
        {"C:\\path\\\"x\"", {"C:\\path\\x"}},
        {"\"unterminated quote", {"unterminated quote"}},
    };
    for (const Case& c : cases) EXPECT_EQ(SplitCommandLine(c.text), c.words) << c.text;
}

TEST(SplitCommandLineTest, JoinGivesTheSameWordsBack) {
    const Words words = {"-hostname", "a b", "", "x\ty", "plain"};
    EXPECT_EQ(SplitCommandLine(JoinCommandLine(words)), words);
}

UpdaterArguments Parsed(const std::string& line) {
    UpdaterArguments arguments;
    EXPECT_TRUE(arguments.Parse(line));
    return arguments;
}

TEST(UpdaterArgumentsTest, DefaultsStayForLinesWithoutSwitches) {
    for (const char* line : {"", "-hostname", "nothing here", "-silent"}) {
        const UpdaterArguments a = Parsed(line);
        EXPECT_EQ(a.serverDeltaTime, 0);
        EXPECT_EQ(a.hostName, kDefaultHostName) << line;
        EXPECT_FALSE(a.kdlGlRemove);
        EXPECT_FALSE(a.silent);
        EXPECT_TRUE(a.downloadEula);
        EXPECT_TRUE(a.loggedIn);
    }
}

TEST(UpdaterArgumentsTest, ComponentRemovalFormReadsOnlyItsOwnFlags) {
    const UpdaterArguments a = Parsed("-KDL_GL_REMOVE -silent -hostname h -delete_corvid");
    EXPECT_TRUE(a.kdlGlRemove);
    EXPECT_TRUE(a.silent);
    EXPECT_TRUE(a.deleteCorvid);
    EXPECT_EQ(a.hostName, kDefaultHostName);
    // Not as the first word: the flags are no switches at all.
    const UpdaterArguments b = Parsed("-silent -kdl_gl_remove -latestVersion 7");
    EXPECT_FALSE(b.kdlGlRemove);
    EXPECT_FALSE(b.silent);
    EXPECT_EQ(b.latestVersion, "7");
}

TEST(UpdaterArgumentsTest, SwitchValuesAsTheyAreRead) {
    struct Case {
        const char* line;
        int32_t delta;
        bool elevated;
        bool eula;
    } cases[] = {
        {"-SERVERDELTATIME 12.9", 12, false, true}, {"-serverDeltaTime -3.7", -3, false, true},
        {"-serverDeltaTime abc", 0, false, true},   {"-serverDeltaTime 1e12", 2147483647, false, true},
        {"-internallyElevated 10", 0, true, true},  {"-internallyElevated true", 0, false, true},
        {"-downloadEula TRUE", 0, false, true},     {"-downloadEula yes", 0, false, false},
    };
    for (const auto& c : cases) {
        const UpdaterArguments a = Parsed(c.line);
        EXPECT_EQ(a.serverDeltaTime, c.delta) << c.line;
        EXPECT_EQ(a.internallyElevated, c.elevated) << c.line;
        EXPECT_EQ(a.downloadEula, c.eula) << c.line;
    }
}

TEST(UpdaterArgumentsTest, EverySwitchWithItsValue) {
    const UpdaterArguments a = Parsed(
        "stray -SID S-1-5-21 -hostname \"back end\" -latestVersion 1001 -doUninstallCleanup true "
        "-doRemoveSettings TRUE -internallyElevated 1 -hostname");
    EXPECT_EQ(a.sid, "S-1-5-21");
    EXPECT_EQ(a.hostName, "back end");
    EXPECT_EQ(a.latestVersion, "1001");
    EXPECT_TRUE(a.doUninstallCleanup);
    EXPECT_TRUE(a.doRemoveSettings);
    EXPECT_TRUE(a.internallyElevated);
    EXPECT_EQ(a.Describe(),
              "Arguments: ServerDeltaTime=0 InternallyElevated=1 loggedIn=1 SessionId= HostName=back end");
}

TEST(UpdaterArgumentsTest, ASkippedWordLetsTheNextBeReadAsASwitch) {
    // "-silent" is no switch here, so "-SID" right after it is still one.
    const UpdaterArguments a = Parsed("-silent -SID s1");
    EXPECT_EQ(a.sid, "s1");
}

}  // namespace
