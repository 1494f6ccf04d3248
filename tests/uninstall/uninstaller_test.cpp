// The uninstall record: what was added and not taken away later, its hive, saving, continuing and removal.
#include "uninstall/uninstaller.h"

#include <gtest/gtest.h>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/test_files.h"

namespace {

using List = std::vector<std::string>;

// Writes a description with these groups into folder and merges it into record.
void Merge(Uninstaller& record, const TempFolder& folder, const std::string& groups) {
    WriteTextFile(folder / "p.xml", "<P>" + groups + "</P>");
    record.AddChanges(folder / "p.xml", true);
}

TEST(Uninstaller, RecordsWhatWasAddedAndNoLaterDescriptionTookAway) {
    TempFolder folder;
    const struct {
        List descriptions;
        List files;  // relative to the installation
    } cases[] = {
        {{"<new Path=\"a\\b.txt\" File=\"1.pak\" /><new Path=\"k.txt\" />",
          "<delete Path=\"a\\b.txt\" /><delete Path=\"k.txt\" /><new Path=\"k.txt\" /><new Path=\"k.txt\" />"},
         {"k.txt"}},
        {{"<diff Path=\"p.exe\" File=\"1.pak\" />"}, {}},
        // Names that would leave the installation are never recorded.
        {{"<new Path=\"..\\..\\Windows\\system.ini\" /><new Path=\"C:\\boot.ini\" /><new Path=\"\\root.txt\" />"
          "<new Path=\"ok\\..x.txt\" />"},
         {"ok\\..x.txt"}},
    };
    for (const auto& item : cases) {
        // Machine-wide even when an elevated copy knows the starting user's SID.
        Uninstaller record(folder.Path(), "Key", folder / "U.xml", "", true, "S-1-5-21-7", false);
        EXPECT_EQ(record.GetHive(), RegistryHive::LocalMachine);
        EXPECT_EQ(record.GetRegistryPath(), "Key");
        for (const std::string& files : item.descriptions)
            Merge(record, folder, "<FileChanges>" + files + "</FileChanges>");
        List expected;
        for (const std::string& name : item.files) expected.push_back(folder / name);
        EXPECT_EQ(record.GetFiles(), expected) << item.descriptions.front();
    }
}

TEST(Uninstaller, SavesTheRecordThenAContinuedOneRemovesFilesAndDirectoriesDeepestFirst) {
    TempFolder folder;
    EXPECT_TRUE(MakeDirectories(folder / "data/x"));
    EXPECT_TRUE(MakeDirectories(folder / "saves"));
    WriteTextFile(folder / "data/x/a.bin", "a");
    WriteTextFile(folder / "saves/user.sav", "not recorded");
    const std::string recordPath = folder / "Uninstall.xml";
    const std::string decoy = folder.Path() + "-decoy.txt";
    WriteTextFile(decoy, "beside the game");
    EXPECT_EQ(Uninstaller("G", "Key", "U.xml", "", false, "", false).GetHive(), RegistryHive::CurrentUser);
    {
        // Per user, started by another user: that user's hive.
        Uninstaller record(folder.Path(), "Software\\Ironvale", recordPath, "", false, "S-1", false);
        // Listed shallowest first: only the deepest-first order removes them all with plain (non-recursive) removals.
        Merge(record, folder,
              "<FileChanges><new Path=\"data\\x\\a.bin\" /><new Path=\"gone.txt\" /></FileChanges>"
              "<DirectoryChanges><new Path=\"saves\" /><new Path=\"data\" /><new Path=\"data\\x\" />"
              "</DirectoryChanges><RegistryChanges><new Path=\"K\" /></RegistryChanges>"
              "<RegistryGroupChanges><new Path=\"G\" /></RegistryGroupChanges>");
        record.AddFile(recordPath);
        record.AddRecordFile();  // listed once
        // An edited record may name anything: only the installation's own files may go.
        record.AddFile(decoy);
        record.AddFile(folder / "data/../../" + GetFileName(decoy));
        ASSERT_TRUE(record.Save());
    }
    // Hive and registry path of a continued record come from the file.
    Uninstaller continued(folder / "Other", "Other", recordPath, "", true, "", true);
    EXPECT_EQ(continued.GetDirectories(), (List{folder / "saves", folder / "data", folder / "data/x"}));
    // Registry names are joined with backslashes on every platform.
    EXPECT_EQ(continued.GetRegistryKeys(), List{"S-1\\Software\\Ironvale\\K"});
    EXPECT_EQ(continued.GetRegistryGroups(), List{"S-1\\Software\\Ironvale\\G"});
    EXPECT_EQ(continued.GetHive(), RegistryHive::Users);
    EXPECT_EQ(continued.GetRegistryPath(), "S-1\\Software\\Ironvale");
    continued.Remove(folder.Path());
    EXPECT_EQ(ReadTextFile(decoy), "beside the game");
    EXPECT_TRUE(RemoveFile(decoy));
    EXPECT_FALSE(PathExists(folder / "data"));
    EXPECT_FALSE(PathExists(recordPath));
    EXPECT_TRUE(PathExists(folder / "saves/user.sav"));
    EXPECT_EQ(continued.GetUndeletableFiles(), List{folder / "gone.txt"});
    EXPECT_EQ(continued.GetUnremovableDirectories(), List{folder / "saves"});
    EXPECT_THROW(Uninstaller(folder / "missing.xml"), Exception);
}

}  // namespace
