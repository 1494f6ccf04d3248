// The progress record: its exact bytes, what counts as unreadable, and the
// recovery matrix of "PPF.xml" and "_PPF.xml" with every torn write.
#include "patch/patch_progress_file.h"

#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

#include "base/exception.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

std::string RecordText(int32_t action, const std::string& file) {
    return "<?xml version=\"1.0\" ?>\n<WestPatchStatus>\n    <PatchPath>C:\\Game\\Patch</PatchPath>\n"
           "    <PatchedFilesPath>C:\\Game\\Patch\\Patched</PatchedFilesPath>\n"
           "    <PatchURI>http://host/patches/1_to_2/</PatchURI>\n    <PatchStatus action=\"" +
           std::to_string(action) + "\" file=\"" + file + "\" />\n    <Version>2.0</Version>\n</WestPatchStatus>\n";
}

std::string Fields(const PatchProgressFile& record) {
    return record.GetPatchPath() + "|" + record.GetPatchedFilesPath() + "|" + record.GetPatchUri() + "|" +
           record.GetVersion() + "|" + std::to_string(record.GetActionIndex()) + "|" + record.GetFile();
}

TEST(PatchProgressFile, WritesTheRecordAsTinyXmlPrintsItAndReadsItBack) {
    TempFolder folder;
    WriteTextFile(folder / "full.xml", RecordText(12, "data\\old.bin"));
    PatchProgressFile record;
    record.SetDirectory(folder.Path());
    ASSERT_TRUE(record.WriteRecord());
    PatchProgressFile loaded;
    loaded.LoadRecord(folder / "full.xml");
    loaded.LoadRecord(folder / "PPF.xml");
    EXPECT_EQ(Fields(loaded), "||||-1|") << "empty values replace the loaded ones";

    record.LoadRecord(folder / "full.xml");
    ASSERT_TRUE(record.WriteRecord());
    EXPECT_EQ(ReadTextFile(folder / "PPF.xml"), WithPlatformLineBreaks(RecordText(12, "data\\old.bin")));
    EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
}

// "PPF.xml", "_PPF.xml" (or none), and the outcome: the action and file of
// the record taken (which is then "PPF.xml", alone; a missing file name is
// an empty one), "none", or the error.
TEST(PatchProgressFile, RecoversFromWhicheverRecordIsReadable) {
    const std::string none = "(no file)";
    const std::string one = RecordText(1, "f");
    const std::string two = RecordText(2, "f");
    const std::string torn = one.substr(0, 100);
    const std::string lost = "Unrecoverable interrupted batch, reinstall necessary. (3)";
    std::vector<std::array<std::string, 3>> cases = {
        {none, none, "none"}, {one, none, "1 f"}, {torn, none, lost}, {none, two, "2 f"}, {none, torn, lost},
        {one, two, "1 f"},    {one, torn, "1 f"}, {torn, two, "2 f"}, {torn, torn, lost},
    };
    cases.push_back({"<S><PatchStatus action=\"4\" /></S>", none, "4 "});
    for (const char* unreadable :
         {"<S><PatchStatus action=\"12abc\" file=\"f\" /></S>", "<S><PatchStatus file=\"f\" /></S>",
          "<S><PatchStatus action=\"2147483648\" file=\"f\" /></S>", "<S><Version>2</Version></S>"}) {
        cases.push_back({unreadable, two, "2 f"});
    }
    // A write cut off anywhere before the end of its XML leaves the previous
    // record, and no such prefix of the new one reads as a record.
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
            try {
                return progress.Recover() ? std::to_string(progress.GetActionIndex()) + " " + progress.GetFile()
                                          : "none";
            } catch (const Exception& error) {
                return error.message + " (" + std::to_string(error.code) + ")";
            }
        };
        EXPECT_EQ(recover(), outcome) << record << "\n" << spare;
        EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
        EXPECT_EQ(recover(), outcome == lost ? "none" : outcome) << "what was taken is left";
    }
}

}  // namespace
