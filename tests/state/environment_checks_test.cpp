// The decisions before an update, fed with any facts: may the updater run on this system, and does it hold the rights
// it needs.
#include "state/environment_checks.h"

#include <gtest/gtest.h>

#include "base/command_line.h"
#include "state/processes.h"

namespace {

TEST(EnvironmentChecks, SystemsAndDirectXVersions) {
    const std::vector<std::string> supported = {"XP", "Vista", "Server2003", "Windows7"};
    EXPECT_TRUE(IsSupportedOs("Server2003", supported));
    EXPECT_TRUE(IsSupportedOs("UnknownVersion", supported));
    EXPECT_FALSE(IsSupportedOs("Windows2000", supported));
    EXPECT_FALSE(IsSupportedOs("windows7", supported));
    const std::tuple<const char*, const char*, bool> directX[] = {
        {"4.09.00.0904", "9", true}, {"4.08.00.0400", "9", false}, {"4.09", "9", false},     {"", "9", false},
        {"4.09.00.0904", "0", true}, {"4.00.00.0900", "9", true},  {"4..10...1", "9", true},
    };
    for (const auto& [installed, required, passes] : directX) {
        EXPECT_EQ(IsDirectXSufficient(installed, required), passes) << installed << " for " << required;
    }
}

struct Facts final : IMachineFacts {
    Facts(const char* name, int32_t type, bool admin, bool uacEnabled)
        : os(name), elevation(type), administrator(admin), uac(uacEnabled) {}
    std::string OsName() override { return os; }
    int32_t ElevationType() override { return elevation; }
    bool IsAdministrator() override { return administrator; }
    bool IsUacEnabled() override { return uac; }
    const std::string os;
    const int32_t elevation;
    const bool administrator, uac;
};

TEST(EnvironmentChecks, RightsFromTheFactsAndWhatTheUpdateNeeds) {
    // OS name, elevation type, administrator, UAC on; then the rights read.
    const std::tuple<const char*, int32_t, bool, bool, bool, bool, bool> facts[] = {
        {"XP", 0, true, true, true, false, false},          {"UnknownVersion", 3, false, true, false, false, false},
        {"Vista", 3, false, true, false, true, true},       {"Windows7", 2, false, false, true, false, false},
        {"Windows7", 1, true, false, true, false, false},   {"Windows7", 1, false, true, false, true, false},
        {"Windows7", 1, false, false, false, false, false}, {"Vista", 0, true, true, false, false, false},
    };
    for (const auto& [os, elevation, administrator, uac, granted, uacOn, canElevate] : facts) {
        Facts machine(os, elevation, administrator, uac);
        const AdminRights rights = CheckAdminRights(machine);
        EXPECT_EQ(std::make_tuple(rights.granted, rights.uacOn, rights.canElevate),
                  std::make_tuple(granted, uacOn, canElevate))
            << os << " " << elevation;
    }

    const AdminRights none{false, false, false}, limited{false, true, true}, full{true, false, false};
    // rights, installation found, needs uninstall, uninstall needs administrator, update needs rights
    const std::tuple<AdminRights, bool, bool, bool, bool, RightsOutcome> decisions[] = {
        {limited, true, false, false, false, RightsOutcome::Granted},  // nothing to write yet
        {limited, true, false, false, true, RightsOutcome::Elevate},
        {none, true, true, true, false, RightsOutcome::NoRightsForRemoval},
        {none, true, false, false, true, RightsOutcome::NoRights},
        {full, false, false, false, true, RightsOutcome::Granted},
    };
    for (const auto& [rights, found, uninstall, removalAdmin, need, expected] : decisions) {
        EXPECT_EQ(DecideRights(rights, found, uninstall, removalAdmin, need), expected)
            << found << uninstall << removalAdmin << need;
    }
}

TEST(Processes, CommandLinesOfTheElevatedCopyAndTheGame) {
    EXPECT_EQ(ElevatedCommandLine("\"C:\\a b\\IronvaleUpdater.exe\" -latestVersion 3", "S-1-5-21-7"),
              "\"C:\\a b\\IronvaleUpdater.exe\" -latestVersion 3 -internallyElevated 1 -SID S-1-5-21-7");
    const ProgramCall call = ElevatedCall("\"C:\\a b\\p.exe\" -x \"1 2\"", "");
    EXPECT_EQ(call.program, "C:\\a b\\p.exe");
    EXPECT_EQ(call.parameters, "\"-x\" \"1 2\" ");
    EXPECT_EQ(ElevatedCall("-x", "p.exe").parameters, "-x");
    EXPECT_EQ(GameParameters("-windowed", "s1", "", "host"), "-windowed +sessionId s1 +webSiteHostName host");
    EXPECT_EQ(GameParameters("", "", "eu,us", ""), " +dataCenters eu,us");
    // A value never becomes two arguments, whatever it holds.
    const std::string injected = "example.com +sessionId stolen", tricky = "a\\\" \\";
    EXPECT_EQ(SplitArguments(GameParameters("-windowed", tricky, "", injected)),
              (std::vector<std::string>{"-windowed", "+sessionId", tricky, "+webSiteHostName", injected}));
}

}  // namespace
