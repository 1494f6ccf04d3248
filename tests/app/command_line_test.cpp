#include <gtest/gtest.h>

#include <utility>

#include "app/updater_arguments.h"
#include "base/command_line.h"

namespace {

using Words = std::vector<std::string>;

TEST(CommandLineTest, SplitsOnBlanksAndQuotesAndJoinsBack) {
    const std::pair<const char*, Words> cases[] = {
        {"", {}},
        {" \t\r\n ", {}},
        {"a  b\tc", {"a", "b", "c"}},
        {"-hostname \"my host\" x", {"-hostname", "my host", "x"}},
        {"-SID \"\" next", {"-SID", "", "next"}},
        {"ab\"c d\"e f", {"abc de", "f"}},
        {"C:\\path\\\"x\"", {"C:\\path\\x"}},
        {"\"unterminated quote", {"unterminated quote"}},
    };
    for (const auto& [text, words] : cases) EXPECT_EQ(SplitCommandLine(text), words) << text;
    const Words joined = {"-hostname", "a b", "", "x\ty", "plain"};
    EXPECT_EQ(SplitCommandLine(JoinCommandLine(joined)), joined);
}

// The fields that differ from their defaults, in a fixed order.
std::string Parsed(const std::string& line) {
    UpdaterArguments a;
    EXPECT_TRUE(a.Parse(line));
    std::string out;
    if (a.serverDeltaTime != 0) out += " delta=" + std::to_string(a.serverDeltaTime);
    if (a.hostName != kDefaultHostName) out += " host=" + a.hostName;
    if (!a.sid.empty()) out += " sid=" + a.sid;
    if (!a.latestVersion.empty()) out += " latest=" + a.latestVersion;
    const bool flags[] = {a.internallyElevated, !a.downloadEula, a.doUninstallCleanup, a.doRemoveSettings,
                          a.kdlGlRemove,        a.silent,        a.deleteCorvid};
    const char* const names[] = {" elevated", " noEula", " cleanup", " settings", " remove", " silent", " corvid"};
    for (size_t i = 0; i < std::size(flags); ++i) out += flags[i] ? names[i] : "";
    return out;
}

TEST(UpdaterArgumentsTest, ReadsEachSwitchAndSkipsTheRest) {
    const std::pair<const char*, const char*> cases[] = {
        {"", ""},
        {"-hostname", ""},
        {"nothing here -silent", ""},
        // The component-removal form reads only its own flags, and only
        // when it comes first.
        {"-KDL_GL_REMOVE -silent -hostname h -delete_corvid", " remove silent corvid"},
        {"-silent -kdl_gl_remove -latestVersion 7", " latest=7"},
        {"-SERVERDELTATIME 12.9", " delta=12"},
        {"-serverDeltaTime -3.7", " delta=-3"},
        {"-serverDeltaTime abc", ""},
        {"-serverDeltaTime 1e12", " delta=2147483647"},
        {"-serverDeltaTime -1e12", " delta=-2147483648"},
        {"-internallyElevated 10", " elevated"},
        {"-internallyElevated true", ""},
        {"-downloadEula TRUE", ""},
        {"-downloadEula yes", " noEula"},
        {"stray -SID S-1-5-21 -hostname \"back end\" -latestVersion 1001 -doUninstallCleanup true "
         "-doRemoveSettings TRUE -internallyElevated 1 -hostname",
         " host=back end sid=S-1-5-21 latest=1001 elevated cleanup settings"},
        // A word that is no switch here lets the next be read as one.
        {"-silent -SID s1", " sid=s1"},
    };
    for (const auto& [line, parsed] : cases) EXPECT_EQ(Parsed(line), parsed) << line;
}

}  // namespace
