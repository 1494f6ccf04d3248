// The progress record: its exact bytes, what counts as unreadable, and the
// recovery matrix of "PPF.xml" and "_PPF.xml".
#include <gtest/gtest.h>

#include <string>

#include "base/exception.h"
#include "patch/patch_progress_file.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

void Fill(PatchProgressFile& record, int32_t action, const std::string& file) {
    record.SetPatchPath("C:\\Game\\Patch");
    record.SetPatchedFilesPath("C:\\Game\\Patch\\Patched");
    record.SetPatchUri("http://host/patches/1_to_2/");
    record.SetVersion("2.0");
    record.SetActionIndex(action);
    record.SetFile(file);
}

std::string RecordText(int32_t action, const std::string& file) {
    return "<?xml version=\"1.0\" ?>\n"
           "<WestPatchStatus>\n"
           "    <PatchPath>C:\\Game\\Patch</PatchPath>\n"
           "    <PatchedFilesPath>C:\\Game\\Patch\\Patched</PatchedFilesPath>\n"
           "    <PatchURI>http://host/patches/1_to_2/</PatchURI>\n"
           "    <PatchStatus action=\"" +
           std::to_string(action) + "\" file=\"" + file +
           "\" />\n"
           "    <Version>2.0</Version>\n"
           "</WestPatchStatus>\n";
}

TEST(PatchProgressFile, WritesTheRecordAsTinyXmlPrintsIt) {
    TempFolder folder;
    PatchProgressFile record;
    record.SetDirectory(folder.Path());
    Fill(record, -1, "");
    ASSERT_TRUE(record.WriteRecord());
    EXPECT_EQ(ReadTextFile(folder / "PPF.xml"), WithPlatformLineBreaks(RecordText(-1, "")));
    EXPECT_FALSE(PathExists(folder / "_PPF.xml"));

    Fill(record, 12, "data\\old.bin");
    ASSERT_TRUE(record.WriteRecord());
    EXPECT_EQ(ReadTextFile(folder / "PPF.xml"), WithPlatformLineBreaks(RecordText(12, "data\\old.bin")));

    PatchProgressFile loaded;
    loaded.LoadRecord(folder / "PPF.xml");
    EXPECT_EQ(loaded.GetPatchPath(), "C:\\Game\\Patch");
    EXPECT_EQ(loaded.GetPatchedFilesPath(), "C:\\Game\\Patch\\Patched");
    EXPECT_EQ(loaded.GetPatchUri(), "http://host/patches/1_to_2/");
    EXPECT_EQ(loaded.GetVersion(), "2.0");
    EXPECT_EQ(loaded.GetActionIndex(), 12);
    EXPECT_EQ(loaded.GetFile(), "data\\old.bin");
}

TEST(PatchProgressFile, EmptyValuesRoundTrip) {
    TempFolder folder;
    PatchProgressFile record;
    record.SetDirectory(folder.Path());
    ASSERT_TRUE(record.WriteRecord());
    EXPECT_NE(ReadTextFile(folder / "PPF.xml").find("<PatchURI></PatchURI>"), std::string::npos);
    PatchProgressFile loaded;
    Fill(loaded, 5, "x");
    loaded.LoadRecord(folder / "PPF.xml");
    EXPECT_EQ(loaded.GetPatchPath(), "");
    EXPECT_EQ(loaded.GetPatchUri(), "");
    EXPECT_EQ(loaded.GetVersion(), "");
    EXPECT_EQ(loaded.GetActionIndex(), -1);
    EXPECT_EQ(loaded.GetFile(), "");
}

TEST(PatchProgressFile, UnreadableRecordsChangeNothing) {
    const struct {
        const char* name;
        std::string content;
    } cases[] = {
        {"action is not a number", "<S><PatchStatus action=\"abc\" file=\"f\" /></S>"},
        {"action with trailing letters", "<S><PatchStatus action=\"12abc\" file=\"f\" /></S>"},
        {"action too large", "<S><PatchStatus action=\"2147483648\" file=\"f\" /></S>"},
        {"action missing", "<S><PatchStatus file=\"f\" /></S>"},
        {"no status", "<S><Version>2</Version></S>"},
        {"torn", RecordText(3, "f").substr(0, 150)},
        {"empty file", ""},
    };
    TempFolder folder;
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        WriteTextFile(folder / "PPF.xml", c.content);
        PatchProgressFile record;
        Fill(record, 7, "kept");
        try {
            record.LoadRecord(folder / "PPF.xml");
            ADD_FAILURE() << "no error";
        } catch (const Exception& error) {
            EXPECT_EQ(error.message, "Failed to load PatchProgressFile file.");
        }
        EXPECT_EQ(record.GetActionIndex(), 7);
        EXPECT_EQ(record.GetFile(), "kept");
    }
    // A missing file attribute alone is just an empty file name.
    WriteTextFile(folder / "PPF.xml", "<S><PatchStatus action=\"4\" /></S>");
    PatchProgressFile record;
    record.LoadRecord(folder / "PPF.xml");
    EXPECT_EQ(record.GetActionIndex(), 4);
    EXPECT_EQ(record.GetFile(), "");
}

enum class Content { Absent, Valid, Broken };

TEST(PatchProgressFile, RecoversFromWhicheverRecordIsReadable) {
    const struct {
        Content record;
        Content alternative;
        bool throws;
        bool found;
        int32_t action;  // which record was taken: 1 from PPF.xml, 2 from _PPF.xml
    } cases[] = {
        {Content::Absent, Content::Absent, false, false, -1}, {Content::Valid, Content::Absent, false, true, 1},
        {Content::Broken, Content::Absent, true, false, -1},  {Content::Absent, Content::Valid, false, true, 2},
        {Content::Absent, Content::Broken, true, false, -1},  {Content::Valid, Content::Valid, false, true, 1},
        {Content::Valid, Content::Broken, false, true, 1},    {Content::Broken, Content::Valid, false, true, 2},
        {Content::Broken, Content::Broken, true, false, -1},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << "PPF " << static_cast<int>(c.record) << ", _PPF "
                                        << static_cast<int>(c.alternative));
        TempFolder folder;
        const auto place = [&](Content content, const std::string& name, int32_t action) {
            if (content == Content::Valid) WriteTextFile(folder / name, RecordText(action, "f"));
            if (content == Content::Broken) WriteTextFile(folder / name, RecordText(action, "f").substr(0, 100));
        };
        place(c.record, "PPF.xml", 1);
        place(c.alternative, "_PPF.xml", 2);
        PatchProgressFile progress;
        progress.SetDirectory(folder.Path());
        if (c.throws) {
            try {
                progress.Recover();
                ADD_FAILURE() << "no error";
            } catch (const Exception& error) {
                EXPECT_EQ(error.message, "Unrecoverable interrupted batch, reinstall necessary.");
                EXPECT_EQ(error.Code(), ErrorCode::ReinstallRequired);
            }
            EXPECT_FALSE(PathExists(folder / "PPF.xml"));
            EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
            continue;
        }
        EXPECT_EQ(progress.Recover(), c.found);
        EXPECT_EQ(progress.GetActionIndex(), c.action);
        // A loaded record is always left as "PPF.xml", and alone.
        EXPECT_EQ(PathExists(folder / "PPF.xml"), c.found);
        EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
        if (c.found) {
            EXPECT_EQ(ReadTextFile(folder / "PPF.xml"), RecordText(c.action, "f"));
        }
    }
}

TEST(PatchProgressFile, AFailedWriteIsReported) {
    TempFolder folder;
    PatchProgressFile record;
    record.SetDirectory(folder / "missing");
    EXPECT_FALSE(record.WriteRecord());
}

}  // namespace
