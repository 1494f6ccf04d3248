// Reading patch descriptions through the nine cursors, and writing the
// uninstall schema exactly as TinyXML prints it.
#include "patch/patch_info_file.h"

#include <gtest/gtest.h>

#include <string>

#include "base/exception.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

// Everything the cursors hand out, one "|"-ended list per cursor: file
// items as "path@archive".
std::string Lists(PatchInfoFile& info) {
    std::string out;
    std::string path;
    std::string archive;
    for (auto next : {&PatchInfoFile::NextDiffFile, &PatchInfoFile::NextNewFile}) {
        while ((info.*next)(path, archive)) out += path + "@" + archive + " ";
        out += "| ";
    }
    for (auto next :
         {&PatchInfoFile::NextDeletedFile, &PatchInfoFile::NextNewDirectory, &PatchInfoFile::NextDeletedDirectory,
          &PatchInfoFile::NextNewRegistryKey, &PatchInfoFile::NextDeletedRegistryKey,
          &PatchInfoFile::NextNewRegistryGroup, &PatchInfoFile::NextDeletedRegistryGroup}) {
        while ((info.*next)(path)) out += path + " ";
        out += "| ";
    }
    EXPECT_EQ(path + archive, "") << "the end of a list empties the outputs";
    return out;
}

TEST(PatchInfoFile, ReadsDescriptionsThroughTheNineCursors) {
    TempFolder folder;
    WriteTextFile(folder / "full.xml",
                  "<?xml version=\"1.0\" ?>\n<AnyRootName>\n  <FileChanges>\n"
                  "    <diff Path=\"bin\\game.exe\" File=\"patch1.pak\" /> <!-- a comment between items -->\n"
                  "    <new Path=\"data\\new.dat\" File=\"patch2.pak\" /> <diff Path=\"bin\\engine.dll\" />\n"
                  "    <delete Path=\"old.txt\" /> <unknown Path=\"skipped\" />\n  </FileChanges>\n"
                  "  <FileChanges><diff Path=\"second list is ignored\" File=\"x\" /></FileChanges>\n"
                  "  <DirectoryChanges><new Path=\"data\" /><delete Path=\"olddir\" /></DirectoryChanges>\n"
                  "  <RegistryChanges><new Path=\"Key\\New\" /><delete Path=\"Key\\Old\" /></RegistryChanges>\n"
                  "  <RegistryGroupChanges><new Path=\"Group\\New\" /><delete Path=\"Group\\Old\" />"
                  "</RegistryGroupChanges>\n  <RegistryHive>HKEY_CURRENT_USER</RegistryHive>\n"
                  "  <RegistryPath>Software\\Ironvale</RegistryPath>\n"
                  "  <SpaceRequirement>123456789012</SpaceRequirement>\n</AnyRootName>\n");
    PatchInfoFile info;
    info.Load(folder / "full.xml");
    EXPECT_EQ(info.GetHive(), RegistryHive::CurrentUser);
    EXPECT_EQ(info.GetRegistryPath(), "Software\\Ironvale");
    EXPECT_EQ(info.GetSpaceRequirement(), 123456789012);
    EXPECT_EQ(info.CountFileAndDirectoryChanges(), 7);
    info.ResetIterators();
    EXPECT_EQ(Lists(info),
              "bin\\game.exe@patch1.pak bin\\engine.dll@ | data\\new.dat@patch2.pak | old.txt | data | olddir | "
              "Key\\New | Key\\Old | Group\\New | Group\\Old | ");

    // Loading again forgets the first description; what is missing takes
    // its default.
    WriteTextFile(folder / "small.xml", "<P><DirectoryChanges><new Path=\"d\" /></DirectoryChanges></P>");
    info.Load(folder / "small.xml");
    info.ResetIterators();
    EXPECT_EQ(Lists(info), "| | | d | | | | | | ");
    EXPECT_EQ(info.CountFileAndDirectoryChanges(), 1);
    EXPECT_EQ(info.GetHive(), RegistryHive::LocalMachine);
    EXPECT_EQ(info.GetRegistryPath(), "");
    EXPECT_EQ(info.GetSpaceRequirement(), -1);

    // The space requirement reads as a stream reads a number; broken files
    // and unknown hives are refused.
    const auto load = [&](const std::string& content) {
        WriteTextFile(folder / "p.xml", content);
        PatchInfoFile other;
        try {
            other.Load(folder / "p.xml");
            return std::to_string(other.GetSpaceRequirement());
        } catch (const Exception& error) {
            return error.message;
        }
    };
    EXPECT_EQ(load("<P><SpaceRequirement>12abc</SpaceRequirement></P>"), "12");
    EXPECT_EQ(load("<P><SpaceRequirement>abc</SpaceRequirement></P>"), "-1");
    EXPECT_EQ(load("<P><SpaceRequirement>99999999999999999999</SpaceRequirement></P>"), "-1");
    EXPECT_EQ(load("<P><FileChanges></P>"), "Failed to load patch info file.");
    EXPECT_EQ(load("<P><RegistryHive>hkey_local_machine</RegistryHive></P>"), "Hive not recognized");
}

// The version a patch leads to and its archives' sizes and digests, which
// the updater judges downloads by: a list it cannot read whole is refused.
TEST(PatchInfoFile, ReadsTheDeclaredArchivesAndVersionOrRefusesTheList) {
    const std::string digest(64, 'a');
    const auto item = [](const std::string& attributes) { return "<archive " + attributes + " />"; };
    const struct {
        std::string archives;  // the content of <Archives>
        std::string read;      // "name=size:sha256 ..." or the refusal's end
    } cases[] = {
        {item("File=\"p0.lzma\" Size=\"12\" Sha256=\"" + std::string(64, 'A') + "\"") + "<other />" +
             item("File=\"p1.lzma\" Size=\"0\" Sha256=\"" + digest + "\""),
         "p0.lzma=12:" + digest + " p1.lzma=0:" + digest + " "},
        {item("Size=\"12\" Sha256=\"" + digest + "\""), "an archive without a name"},
        {item("File=\"p0\" Sha256=\"" + digest + "\""), "the size of p0"},
        {item("File=\"p0\" Size=\"-1\" Sha256=\"" + digest + "\""), "the size of p0"},
        {item("File=\"p0\" Size=\" 12\" Sha256=\"" + digest + "\""), "the size of p0"},
        {item("File=\"p0\" Size=\"9999999999999999999\" Sha256=\"" + digest + "\""), "the size of p0"},
        {item("File=\"p0\" Size=\"1\" Sha256=\"" + digest.substr(1) + "\""), "the SHA-256 of p0"},
        {item("File=\"p0\" Size=\"1\" Sha256=\"" + digest.substr(1) + "g\""), "the SHA-256 of p0"},
        {item("File=\"p0\" Size=\"1\" Sha256=\"" + digest + "\"") +
             item("File=\"p0\" Size=\"1\" Sha256=\"" + digest + "\""),
         "p0 is listed twice"},
    };
    TempFolder folder;
    for (const auto& c : cases) {
        SCOPED_TRACE(c.archives);
        WriteTextFile(folder / "p.xml", "<P><Version>7</Version><Archives>" + c.archives + "</Archives></P>");
        PatchInfoFile info;
        try {
            info.Load(folder / "p.xml");
            std::string read;
            for (const auto& [name, archive] : info.GetDeclaredArchives()) {
                read += name + "=" + std::to_string(archive.size) + ":" + archive.sha256 + " ";
            }
            EXPECT_EQ(read, c.read);
            EXPECT_EQ(info.GetVersion(), "7");
        } catch (const Exception& error) {
            EXPECT_EQ(error.Code(), ErrorCode::CorruptData);
            EXPECT_EQ(error.message, "Invalid archive list in patch info file: " + c.read);
        }
    }
    // Older descriptions say neither, also when loaded after one that did.
    PatchInfoFile info;
    WriteTextFile(folder / "p.xml", "<P><Version>7</Version><Archives>" + cases[0].archives + "</Archives></P>");
    info.Load(folder / "p.xml");
    WriteTextFile(folder / "p.xml", "<P><FileChanges /></P>");
    info.Load(folder / "p.xml");
    EXPECT_EQ(info.GetVersion(), "");
    EXPECT_TRUE(info.GetDeclaredArchives().empty());
}

TEST(PatchInfoFile, SavesTheUninstallSchemaAsTinyXmlPrintsIt) {
    TempFolder folder;
    ASSERT_TRUE(PatchInfoFile::Save(folder / "u.xml", {"C:\\G\\a.txt", "C:\\G\\b&c.txt"}, {}, {}, {"Grp"},
                                    RegistryHive::Users, ""));
    EXPECT_EQ(
        ReadTextFile(folder / "u.xml"),
        WithPlatformLineBreaks("<?xml version=\"1.0\" ?>\n<IronvaleWestPatch>\n    <FileChanges>\n"
                               "        <new Path=\"C:\\G\\a.txt\" />\n        <new Path=\"C:\\G\\b&amp;c.txt\" />\n"
                               "    </FileChanges>\n    <DirectoryChanges />\n    <RegistryChanges />\n"
                               "    <RegistryGroupChanges>\n        <new Path=\"Grp\" />\n    </RegistryGroupChanges>\n"
                               "    <RegistryHive>HKEY_USERS</RegistryHive>\n    <RegistryPath></RegistryPath>\n"
                               "</IronvaleWestPatch>\n"));
    // Read back as a description, the items are its new items.
    PatchInfoFile info;
    info.Load(folder / "u.xml");
    info.ResetIterators();
    EXPECT_EQ(Lists(info), "| C:\\G\\a.txt@ C:\\G\\b&c.txt@ | | | | | | Grp | | ");
    EXPECT_EQ(info.GetHive(), RegistryHive::Users);

    // A hive outside the three cannot be written, and nothing is.
    EXPECT_THROW(PatchInfoFile::Save(folder / "none.xml", {}, {}, {}, {}, RegistryHive::None, ""), Exception);
    EXPECT_FALSE(PathExists(folder / "none.xml"));
}

}  // namespace
