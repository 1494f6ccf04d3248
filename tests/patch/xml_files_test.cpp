// The XML files of a batch: descriptions read or refused, the progress record and uninstall schema printed as TinyXML
// does, and the progress record's recovery from "PPF.xml" and "_PPF.xml" with every torn write.
#include <gtest/gtest.h>

#include <array>
#include <vector>

#include "base/exception.h"
#include "base/xml_file.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "tests/support/test_files.h"

namespace {

// Expected XML with "\n" turned into this platform's line break.
std::string WithPlatformLineBreaks(const std::string& text) {
    std::string result;
    for (char c : text) result += c == '\n' ? std::string(kXmlLineBreak) : std::string(1, c);
    return result;
}

// Everything a description says, or the refusal and its code: one "|"-ended list per cursor (file items as
// "path@archive"), then the hive, registry path, space requirement, count of changes, version and archives.
std::string Read(PatchInfoFile& info, const std::string& path) {
    const std::string error = ErrorOf([&] { info.Load(path); });
    if (!error.empty()) return error;
    info.ResetIterators();
    std::string out, item, archive;
    for (auto next : {&PatchInfoFile::NextDiffFile, &PatchInfoFile::NextNewFile}) {
        while ((info.*next)(item, archive)) out += item + "@" + archive + " ";
        out += "| ";
    }
    for (auto next :
         {&PatchInfoFile::NextDeletedFile, &PatchInfoFile::NextNewDirectory, &PatchInfoFile::NextDeletedDirectory,
          &PatchInfoFile::NextNewRegistryKey, &PatchInfoFile::NextDeletedRegistryKey,
          &PatchInfoFile::NextNewRegistryGroup, &PatchInfoFile::NextDeletedRegistryGroup}) {
        while ((info.*next)(item)) out += item + " ";
        out += "| ";
    }
    EXPECT_EQ(item + archive, "") << "the end of a list empties the outputs";
    out += std::to_string(static_cast<int>(info.GetHive())) + " " + info.GetRegistryPath() + " " +
           std::to_string(info.GetSpaceRequirement()) + " " + std::to_string(info.CountFileAndDirectoryChanges()) +
           " v" + info.GetVersion();
    for (const auto& [name, declared] : info.GetDeclaredArchives()) {
        out += " " + name + "=" + std::to_string(declared.size) + ":" + declared.sha256;
    }
    return out;
}

// One object loads every row in turn: what a row leaves out takes its default, whatever the row before said.
TEST(PatchInfoFile, ReadsDescriptionsOrRefusesThem) {
    const std::string digest(64, 'a');
    const auto archive = [](const std::string& name, const std::string& size, const std::string& sha256) {
        return "<archive File=\"" + name + "\" Size=\"" + size + "\" Sha256=\"" + sha256 + "\" />";
    };
    const auto list = [](const std::string& archives) { return "<P><Archives>" + archives + "</Archives></P>"; };
    const std::string badList = "Invalid archive list in patch info file: ";
    const std::pair<std::string, std::string> rows[] = {
        {"<AnyRootName>\n  <FileChanges>\n"
         "    <diff Path=\"bin\\game.exe\" File=\"patch1.pak\" /> <!-- a comment between items -->\n"
         "    <new Path=\"data\\new.dat\" File=\"patch2.pak\" /> <diff Path=\"bin\\engine.dll\" />\n"
         "    <delete Path=\"old.txt\" /> <unknown Path=\"skipped\" />\n  </FileChanges>\n"
         "  <FileChanges><diff Path=\"second list is ignored\" File=\"x\" /></FileChanges>\n"
         "  <DirectoryChanges><new Path=\"data\" /><delete Path=\"olddir\" /></DirectoryChanges>\n"
         "  <RegistryChanges><new Path=\"Key\\New\" /><delete Path=\"Key\\Old\" /></RegistryChanges>\n"
         "  <RegistryGroupChanges><new Path=\"Group\\New\" /><delete Path=\"Group\\Old\" />"
         "</RegistryGroupChanges>\n  <RegistryHive>HKEY_CURRENT_USER</RegistryHive>\n"
         "  <RegistryPath>Software\\Ironvale</RegistryPath>\n  <SpaceRequirement>123456789012</SpaceRequirement>\n"
         "  <Version>7</Version><Archives>" +
             archive("p0.lzma", "12", std::string(64, 'A')) + "<other />" + archive("p1.lzma", "0", digest) +
             "</Archives>\n</AnyRootName>\n",
         "bin\\game.exe@patch1.pak bin\\engine.dll@ | data\\new.dat@patch2.pak | old.txt | data | olddir | "
         "Key\\New | Key\\Old | Group\\New | Group\\Old | 2 Software\\Ironvale 123456789012 7 v7 p0.lzma=12:" +
             digest + " p1.lzma=0:" + digest},
        {"<P><DirectoryChanges><new Path=\"d\" /></DirectoryChanges></P>", "| | | d | | | | | | 1  -1 1 v"},
        // The space requirement reads as a stream reads a number.
        {"<P><SpaceRequirement>12abc</SpaceRequirement></P>", "| | | | | | | | | 1  12 0 v"},
        {"<P><SpaceRequirement>abc</SpaceRequirement></P>", "| | | | | | | | | 1  -1 0 v"},
        {"<P><SpaceRequirement>99999999999999999999</SpaceRequirement></P>", "| | | | | | | | | 1  -1 0 v"},
        {"<P><FileChanges></P>", "Failed to load patch info file. (0)"},
        {"<P><RegistryHive>hkey_local_machine</RegistryHive></P>", "Hive not recognized (0)"},
        // The archives judge downloads: a list not read whole is refused.
        {list("<archive Size=\"12\" Sha256=\"" + digest + "\" />"), badList + "an archive without a name (12)"},
        {list("<archive File=\"p0\" Sha256=\"" + digest + "\" />"), badList + "the size of p0 (12)"},
        {list(archive("p0", "-1", digest)), badList + "the size of p0 (12)"},
        {list(archive("p0", " 12", digest)), badList + "the size of p0 (12)"},
        {list(archive("p0", "9999999999999999999", digest)), badList + "the size of p0 (12)"},
        {list(archive("p0", "1", digest.substr(1))), badList + "the SHA-256 of p0 (12)"},
        {list(archive("p0", "1", digest.substr(1) + "g")), badList + "the SHA-256 of p0 (12)"},
        {list(archive("p0", "1", digest) + archive("p0", "1", digest)), badList + "p0 is listed twice (12)"},
    };
    TempFolder folder;
    PatchInfoFile info;
    for (const auto& [content, read] : rows) {
        WriteTextFile(folder / "p.xml", content);
        EXPECT_EQ(Read(info, folder / "p.xml"), read) << content;
    }
}

std::string RecordText(int32_t action, const std::string& file) {
    return "<?xml version=\"1.0\" ?>\n<WestPatchStatus>\n    <PatchPath>C:\\Game\\Patch</PatchPath>\n"
           "    <PatchedFilesPath>C:\\Game\\Patch\\Patched</PatchedFilesPath>\n"
           "    <PatchURI>http://host/patches/1_to_2/</PatchURI>\n    <PatchStatus action=\"" +
           std::to_string(action) + "\" file=\"" + file + "\" />\n    <Version>2.0</Version>\n</WestPatchStatus>\n";
}

// The progress record and the uninstall schema, exactly as TinyXML prints them.
TEST(XmlFiles, AreWrittenAsTinyXmlPrintsThem) {
    TempFolder folder;
    WriteTextFile(folder / "full.xml", RecordText(12, "data\\old.bin"));
    PatchProgressFile record;
    record.SetDirectory(folder.Path());
    ASSERT_TRUE(record.WriteRecord());
    PatchProgressFile loaded;
    loaded.LoadRecord(folder / "full.xml");
    loaded.LoadRecord(folder / "PPF.xml");
    EXPECT_EQ(loaded.GetPatchPath() + loaded.GetPatchedFilesPath() + loaded.GetPatchUri() + loaded.GetVersion() +
                  loaded.GetFile() + std::to_string(loaded.GetActionIndex()),
              "-1")
        << "empty values replace the loaded ones";

    record.LoadRecord(folder / "full.xml");
    ASSERT_TRUE(record.WriteRecord());
    EXPECT_EQ(ReadTextFile(folder / "PPF.xml"), WithPlatformLineBreaks(RecordText(12, "data\\old.bin")));
    EXPECT_FALSE(PathExists(folder / "_PPF.xml"));

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
    // A hive outside the three cannot be written, and nothing is.
    EXPECT_THROW(static_cast<void>(PatchInfoFile::Save(folder / "none.xml", {}, {}, {}, {}, RegistryHive::None, "")),
                 Exception);
    EXPECT_FALSE(PathExists(folder / "none.xml"));
}

// "PPF.xml", "_PPF.xml" (or none), and the outcome: the action and file of the record taken (which is then "PPF.xml",
// alone; a missing file name is an empty one), "none", or the error.
TEST(PatchProgressFile, RecoversFromWhicheverRecordIsReadable) {
    const std::string none = "(no file)";
    const std::string one = RecordText(1, "f");
    const std::string two = RecordText(2, "f");
    const std::string torn = one.substr(0, 100);
    const std::string lost = "Unrecoverable interrupted batch, reinstall necessary. (3)";
    std::vector<std::array<std::string, 3>> cases = {
        {none, none, "none"}, {one, none, "1 f"},
        {torn, none, lost},   {none, two, "2 f"},
        {one, two, "1 f"},    {torn, two, "2 f"},
        {torn, torn, lost},   {"<S><PatchStatus action=\"4\" /></S>", none, "4 "},
    };
    for (const char* unreadable :
         {"<S><PatchStatus action=\"12abc\" file=\"f\" /></S>", "<S><PatchStatus file=\"f\" /></S>",
          "<S><PatchStatus action=\"2147483648\" file=\"f\" /></S>", "<S><Version>2</Version></S>"}) {
        cases.push_back({unreadable, two, "2 f"});
    }
    // A write cut off anywhere before the end of its XML leaves the previous record, and no such prefix of the new one
    // reads as a record.
    for (size_t k = 0; k + 1 < two.size(); ++k) {
        cases.push_back({one, two.substr(0, k), "1 f"});
        cases.push_back({none, two.substr(0, k), lost});
    }
    for (const auto& [record, spare, outcome] : cases) {
        TempFolder folder;
        if (record != none) WriteTextFile(folder / "PPF.xml", record);
        if (spare != none) WriteTextFile(folder / "_PPF.xml", spare);
        const auto recover = [&folder] {
            PatchProgressFile progress;
            progress.SetDirectory(folder.Path());
            std::string taken = "none";
            const std::string error = ErrorOf([&] {
                if (progress.Recover()) taken = std::to_string(progress.GetActionIndex()) + " " + progress.GetFile();
            });
            return error.empty() ? taken : error;
        };
        EXPECT_EQ(recover(), outcome) << record << "\n" << spare;
        EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
        EXPECT_EQ(recover(), outcome == lost ? "none" : outcome) << "what was taken is left";
    }
}

}  // namespace
