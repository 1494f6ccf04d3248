// The uninstall record: merging descriptions, the hive of each kind of
// installation, saving, reading back and removal.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"
#include "uninstall/uninstaller.h"

namespace {

using List = std::vector<std::string>;

std::string Description(const std::string& fileChanges, const std::string& rest = "") {
    return "<P><FileChanges>" + fileChanges + "</FileChanges>" + rest + "</P>";
}

TEST(Uninstaller, RecordsWhatWasAddedAndNotTakenAwayLater) {
    TempFolder folder;
    const std::string install = folder / "Game";
    WriteTextFile(folder / "p1.xml", Description("<new Path=\"a\\b.txt\" File=\"1.pak\" /><new Path=\"keep.txt\" />"
                                                 "<diff Path=\"patched.exe\" File=\"1.pak\" />",
                                                 "<DirectoryChanges><new Path=\"a\" /></DirectoryChanges>"
                                                 "<RegistryChanges><new Path=\"Sub\" /></RegistryChanges>"));
    WriteTextFile(folder / "p2.xml", Description("<delete Path=\"a\\b.txt\" /><delete Path=\"keep.txt\" />"
                                                 "<new Path=\"keep.txt\" /><new Path=\"keep.txt\" />"));
    Uninstaller record(install, "Software\\Ironvale", folder / "Uninstall.xml", "{GUID}", true, "", false);
    record.AddChanges(folder / "p1.xml", true);
    record.AddChanges(folder / "p2.xml", true);
    record.AddFile(PathJoin(install, "UpdateHistory.log"));
    record.AddFile(PathJoin(install, "UpdateHistory.log"));
    record.AddRecordFile();
    EXPECT_EQ(record.GetFiles(),
              (List{PathJoin(install, "keep.txt"), PathJoin(install, "UpdateHistory.log"), folder / "Uninstall.xml"}));
    EXPECT_EQ(record.GetDirectories(), List{PathJoin(install, "a")});
    // Registry names are joined with backslashes on every platform.
    EXPECT_EQ(record.GetRegistryKeys(), List{"Software\\Ironvale\\Sub"});
}

TEST(Uninstaller, NeverRecordsPathsOutsideTheInstallation) {
    TempFolder folder;
    WriteTextFile(folder / "p.xml", Description("<new Path=\"..\\..\\Windows\\system.ini\" />"
                                                "<new Path=\"C:\\boot.ini\" /><new Path=\"\\root.txt\" />"
                                                "<new Path=\"ok\\..x.txt\" />",
                                                "<DirectoryChanges><new Path=\"sub/../..\" /></DirectoryChanges>"));
    Uninstaller record(folder / "Game", "Key", folder / "Uninstall.xml", "", false, "", false);
    record.AddChanges(folder / "p.xml", true);
    EXPECT_EQ(record.GetFiles(), List{PathJoin(folder / "Game", "ok\\..x.txt")});
    EXPECT_TRUE(record.GetDirectories().empty());
}

TEST(Uninstaller, ChoosesTheHiveByTheKindOfInstallation) {
    const struct {
        const char* name;
        bool machineWide;
        const char* sid;
        RegistryHive hive;
        const char* registryPath;
    } cases[] = {
        {"machine-wide", true, "", RegistryHive::LocalMachine, "Software\\Ironvale"},
        {"per user", false, "", RegistryHive::CurrentUser, "Software\\Ironvale"},
        {"another user's, from an elevated copy", false, "S-1-5-21-7", RegistryHive::Users,
         "S-1-5-21-7\\Software\\Ironvale"},
        {"machine-wide wins over a SID", true, "S-1-5-21-7", RegistryHive::LocalMachine, "Software\\Ironvale"},
    };
    TempFolder folder;
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        Uninstaller record(folder.Path(), "Software\\Ironvale", folder / "U.xml", "", c.machineWide, c.sid, false);
        EXPECT_EQ(record.GetHive(), c.hive);
        EXPECT_EQ(record.GetRegistryPath(), c.registryPath);
    }
}

TEST(Uninstaller, SavesAndReadsTheRecordBackAsStored) {
    TempFolder folder;
    const std::string recordPath = folder / "Uninstall.xml";
    WriteTextFile(folder / "p.xml", Description("<new Path=\"x.dat\" />",
                                                "<RegistryGroupChanges><new Path=\"G\" /></RegistryGroupChanges>"));
    {
        Uninstaller record(folder / "Game", "Software\\Ironvale", recordPath, "", false, "S-1", false);
        record.AddChanges(folder / "p.xml", true);
        ASSERT_TRUE(record.Save());
    }
    const std::string file = PathJoin(folder / "Game", "x.dat");
    EXPECT_EQ(ReadTextFile(recordPath),
              WithPlatformLineBreaks("<?xml version=\"1.0\" ?>\n"
                                     "<IronvaleWestPatch>\n"
                                     "    <FileChanges>\n"
                                     "        <new Path=\"" +
                                     file +
                                     "\" />\n"
                                     "    </FileChanges>\n"
                                     "    <DirectoryChanges />\n"
                                     "    <RegistryChanges />\n"
                                     "    <RegistryGroupChanges>\n"
                                     "        <new Path=\"S-1\\Software\\Ironvale\\G\" />\n"
                                     "    </RegistryGroupChanges>\n"
                                     "    <RegistryHive>HKEY_USERS</RegistryHive>\n"
                                     "    <RegistryPath>S-1\\Software\\Ironvale</RegistryPath>\n"
                                     "</IronvaleWestPatch>\n"));

    Uninstaller reading(recordPath);
    EXPECT_EQ(reading.GetFiles(), List{file});
    EXPECT_EQ(reading.GetRegistryGroups(), List{"S-1\\Software\\Ironvale\\G"});
    EXPECT_EQ(reading.GetHive(), RegistryHive::Users);

    // The recording form can continue an existing record; hive and path
    // then come from the file.
    Uninstaller continued(folder / "Game", "Other", recordPath, "", true, "", true);
    EXPECT_EQ(continued.GetHive(), RegistryHive::Users);
    EXPECT_EQ(continued.GetRegistryPath(), "S-1\\Software\\Ironvale");
    EXPECT_EQ(continued.GetFiles(), List{file});

    EXPECT_THROW(Uninstaller(folder / "missing.xml"), Exception);
}

TEST(Uninstaller, RemovesFilesThenDirectoriesDeepestFirst) {
    TempFolder folder;
    const std::string game = folder / "G";
    const std::string data = PathJoin(game, "data");
    const std::string deep = PathJoin(data, "x");
    const std::string kept = PathJoin(game, "saves");
    std::filesystem::create_directories(deep);
    std::filesystem::create_directories(kept);
    WriteTextFile(PathJoin(deep, "a.bin"), "a");
    WriteTextFile(PathJoin(kept, "user.sav"), "not recorded");
    const std::string list =
        "<new Path=\"" + PathJoin(deep, "a.bin") + "\" /><new Path=\"" + PathJoin(game, "gone.txt") + "\" />";
    // Listed shallowest first: only the deepest-first order can remove
    // them all with plain (non-recursive) removals.
    const std::string directories = "<DirectoryChanges><new Path=\"" + game + "\" /><new Path=\"" + kept +
                                    "\" /><new Path=\"" + data + "\" /><new Path=\"" + deep +
                                    "\" /><new Path=\"\" />"
                                    "</DirectoryChanges>";
    WriteTextFile(folder / "Uninstall.xml", Description(list, directories));

    Uninstaller record(folder / "Uninstall.xml");
    record.Remove();
    EXPECT_FALSE(PathExists(deep));
    EXPECT_FALSE(PathExists(data));
    EXPECT_TRUE(PathExists(PathJoin(kept, "user.sav")));
    EXPECT_EQ(record.GetUndeletableFiles(), List{PathJoin(game, "gone.txt")});
    EXPECT_EQ(record.GetUnremovableDirectories(), (List{kept, game, ""}));
}

}  // namespace
