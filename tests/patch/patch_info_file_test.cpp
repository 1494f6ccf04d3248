// Reading patch descriptions through the nine cursors, and writing the
// uninstall schema exactly as TinyXML prints it.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "base/exception.h"
#include "patch/patch_info_file.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

const char kFullDescription[] =
    "<?xml version=\"1.0\" ?>\n"
    "<AnyRootName>\n"
    "    <FileChanges>\n"
    "        <diff Path=\"bin\\game.exe\" File=\"patch1.pak\" />\n"
    "        <!-- a comment between items -->\n"
    "        <new Path=\"data\\new.dat\" File=\"patch2.pak\" />\n"
    "        <diff Path=\"bin\\engine.dll\" />\n"
    "        <delete Path=\"old.txt\" />\n"
    "        <unknown Path=\"skipped\" />\n"
    "    </FileChanges>\n"
    "    <FileChanges><diff Path=\"second list is ignored\" File=\"x\" /></FileChanges>\n"
    "    <DirectoryChanges>\n"
    "        <new Path=\"data\" />\n"
    "        <delete Path=\"olddir\" />\n"
    "    </DirectoryChanges>\n"
    "    <RegistryChanges><new Path=\"Key\\New\" /><delete Path=\"Key\\Old\" /></RegistryChanges>\n"
    "    <RegistryGroupChanges><new Path=\"Group\\New\" /><delete Path=\"Group\\Old\" /></RegistryGroupChanges>\n"
    "    <RegistryHive>HKEY_CURRENT_USER</RegistryHive>\n"
    "    <RegistryPath>Software\\Ironvale</RegistryPath>\n"
    "    <SpaceRequirement>123456789012</SpaceRequirement>\n"
    "</AnyRootName>\n";

using Cursor = bool (PatchInfoFile::*)(std::string&);

std::vector<std::string> Drain(PatchInfoFile& file, Cursor next) {
    std::vector<std::string> items;
    std::string path;
    while ((file.*next)(path)) items.push_back(path);
    EXPECT_EQ(path, "") << "the end of a list empties the output";
    return items;
}

using List = std::vector<std::string>;

TEST(PatchInfoFile, HandsOutEveryListThroughItsCursor) {
    TempFolder folder;
    WriteTextFile(folder / "patchinfo.xml", kFullDescription);
    PatchInfoFile info;
    info.Load(folder / "patchinfo.xml");
    EXPECT_EQ(info.GetHive(), RegistryHive::CurrentUser);
    EXPECT_EQ(info.GetRegistryPath(), "Software\\Ironvale");
    EXPECT_EQ(info.GetSpaceRequirement(), 123456789012);
    EXPECT_EQ(info.CountFileAndDirectoryChanges(), 7);

    std::string path;
    std::string archive;
    EXPECT_FALSE(info.NextDiffFile(path, archive)) << "cursors start only with ResetIterators";

    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE(round);
        info.ResetIterators();
        ASSERT_TRUE(info.NextDiffFile(path, archive));
        EXPECT_EQ(path, "bin\\game.exe");
        EXPECT_EQ(archive, "patch1.pak");
        ASSERT_TRUE(info.NextDiffFile(path, archive));
        EXPECT_EQ(path, "bin\\engine.dll");
        EXPECT_EQ(archive, "");
        EXPECT_FALSE(info.NextDiffFile(path, archive));
        ASSERT_TRUE(info.NextNewFile(path, archive));
        EXPECT_EQ(archive, "patch2.pak");
        EXPECT_FALSE(info.NextNewFile(path, archive));
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextDeletedFile), List{"old.txt"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextNewDirectory), List{"data"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextDeletedDirectory), List{"olddir"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextNewRegistryKey), List{"Key\\New"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextDeletedRegistryKey), List{"Key\\Old"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextNewRegistryGroup), List{"Group\\New"});
        EXPECT_EQ(Drain(info, &PatchInfoFile::NextDeletedRegistryGroup), List{"Group\\Old"});
    }
}

TEST(PatchInfoFile, MissingPartsTakeTheirDefaults) {
    TempFolder folder;
    WriteTextFile(folder / "p.xml", "<P><DirectoryChanges><new Path=\"d\" /></DirectoryChanges></P>");
    PatchInfoFile info;
    info.Load(folder / "p.xml");
    info.ResetIterators();
    std::string path;
    std::string archive;
    EXPECT_FALSE(info.NextDiffFile(path, archive));
    EXPECT_FALSE(info.NextNewFile(path, archive));
    EXPECT_FALSE(info.NextDeletedFile(path));
    EXPECT_EQ(info.CountFileAndDirectoryChanges(), 1);
    EXPECT_EQ(info.GetHive(), RegistryHive::LocalMachine);
    EXPECT_EQ(info.GetRegistryPath(), "");
    EXPECT_EQ(info.GetSpaceRequirement(), -1);
}

TEST(PatchInfoFile, ReadsTheSpaceRequirementAsAStreamDoes) {
    const struct {
        const char* text;
        int64_t expected;
    } cases[] = {{"12abc", 12}, {"abc", -1}, {"  42", 42}, {"-7", -7}, {"99999999999999999999", -1}};
    TempFolder folder;
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        WriteTextFile(folder / "p.xml", std::string("<P><SpaceRequirement>") + c.text + "</SpaceRequirement></P>");
        PatchInfoFile info;
        info.Load(folder / "p.xml");
        EXPECT_EQ(info.GetSpaceRequirement(), c.expected);
    }
}

TEST(PatchInfoFile, RejectsUnreadableFilesAndUnknownHives) {
    TempFolder folder;
    const struct {
        const char* name;
        const char* content;
        const char* error;
    } cases[] = {
        {"malformed", "<P><FileChanges></P>", "Failed to load patch info file."},
        {"no element", "just text", "Failed to load patch info file."},
        {"hive in lower case", "<P><RegistryHive>hkey_local_machine</RegistryHive></P>", "Hive not recognized"},
        {"other hive", "<P><RegistryHive>HKEY_CLASSES_ROOT</RegistryHive></P>", "Hive not recognized"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        WriteTextFile(folder / "p.xml", c.content);
        PatchInfoFile info;
        try {
            info.Load(folder / "p.xml");
            ADD_FAILURE() << "no error";
        } catch (const Exception& error) {
            EXPECT_EQ(error.message, c.error);
        }
    }
    PatchInfoFile info;
    EXPECT_THROW(info.Load(folder / "missing.xml"), Exception);
}

TEST(PatchInfoFile, LoadingAgainForgetsTheEarlierDescription) {
    TempFolder folder;
    WriteTextFile(folder / "a.xml", kFullDescription);
    WriteTextFile(folder / "b.xml", "<P />");
    PatchInfoFile info;
    info.Load(folder / "a.xml");
    info.Load(folder / "b.xml");
    EXPECT_EQ(info.GetHive(), RegistryHive::LocalMachine);
    EXPECT_EQ(info.GetRegistryPath(), "");
    EXPECT_EQ(info.GetSpaceRequirement(), -1);
    EXPECT_EQ(info.CountFileAndDirectoryChanges(), 0);
}

TEST(PatchInfoFile, SavesTheUninstallSchemaAsTinyXmlPrintsIt) {
    TempFolder folder;
    ASSERT_TRUE(PatchInfoFile::Save(folder / "u.xml", {"C:\\G\\a.txt", "C:\\G\\b&c.txt"}, {"C:\\G"}, {}, {"Grp"},
                                    RegistryHive::Users, "S-1-5-21\\Software\\Ironvale"));
    EXPECT_EQ(ReadTextFile(folder / "u.xml"),
              WithPlatformLineBreaks("<?xml version=\"1.0\" ?>\n"
                                     "<IronvaleWestPatch>\n"
                                     "    <FileChanges>\n"
                                     "        <new Path=\"C:\\G\\a.txt\" />\n"
                                     "        <new Path=\"C:\\G\\b&amp;c.txt\" />\n"
                                     "    </FileChanges>\n"
                                     "    <DirectoryChanges>\n"
                                     "        <new Path=\"C:\\G\" />\n"
                                     "    </DirectoryChanges>\n"
                                     "    <RegistryChanges />\n"
                                     "    <RegistryGroupChanges>\n"
                                     "        <new Path=\"Grp\" />\n"
                                     "    </RegistryGroupChanges>\n"
                                     "    <RegistryHive>HKEY_USERS</RegistryHive>\n"
                                     "    <RegistryPath>S-1-5-21\\Software\\Ironvale</RegistryPath>\n"
                                     "</IronvaleWestPatch>\n"));

    // Read back as a description, the items are its new items.
    PatchInfoFile info;
    info.Load(folder / "u.xml");
    info.ResetIterators();
    std::string path;
    std::string archive;
    ASSERT_TRUE(info.NextNewFile(path, archive));
    ASSERT_TRUE(info.NextNewFile(path, archive));
    EXPECT_EQ(path, "C:\\G\\b&c.txt");
    EXPECT_EQ(info.GetHive(), RegistryHive::Users);

    ASSERT_TRUE(PatchInfoFile::Save(folder / "empty.xml", {}, {}, {}, {}, RegistryHive::LocalMachine, ""));
    EXPECT_EQ(ReadTextFile(folder / "empty.xml"),
              WithPlatformLineBreaks("<?xml version=\"1.0\" ?>\n"
                                     "<IronvaleWestPatch>\n"
                                     "    <FileChanges />\n"
                                     "    <DirectoryChanges />\n"
                                     "    <RegistryChanges />\n"
                                     "    <RegistryGroupChanges />\n"
                                     "    <RegistryHive>HKEY_LOCAL_MACHINE</RegistryHive>\n"
                                     "    <RegistryPath></RegistryPath>\n"
                                     "</IronvaleWestPatch>\n"));

    // A hive outside the three cannot be written, and nothing is.
    EXPECT_THROW(PatchInfoFile::Save(folder / "none.xml", {}, {}, {}, {}, RegistryHive::None, ""), Exception);
    EXPECT_FALSE(PathExists(folder / "none.xml"));
}

}  // namespace
