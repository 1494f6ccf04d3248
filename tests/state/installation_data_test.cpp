// InstallationData.xml: required and optional values, the digest map, and
// the exact bytes written.
#include <gtest/gtest.h>

#include <map>
#include <string>

#include "base/exception.h"
#include "state/installation_data.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

using Hashes = std::map<std::string, std::string>;

std::string LoadError(const std::string& content) {
    TempFolder folder;
    WriteTextFile(folder / "InstallationData.xml", content);
    InstallationData data;
    try {
        data.Load(folder.Path());
    } catch (const Exception& error) {
        return error.message;
    }
    return "loaded";
}

TEST(InstallationData, OptionalValuesTakeTheirDefaults) {
    TempFolder folder;
    WriteTextFile(folder / "InstallationData.xml",
                  "<Whatever><PatcherVersion>3</PatcherVersion><CurrentVersion>1.2</CurrentVersion></Whatever>");
    InstallationData data;
    data.Load(folder.Path());
    EXPECT_EQ(data.currentVersion, "1.2");
    EXPECT_EQ(data.patcherVersion, "3");
    EXPECT_EQ(data.eulaVersion, "0");
    EXPECT_EQ(data.pbEulaVersion, "0");
    EXPECT_EQ(data.sku, "");
    EXPECT_TRUE(data.installedHashes.empty());
    EXPECT_EQ(data.directory, folder.Path());
    EXPECT_EQ(data.filePath, folder / "InstallationData.xml");
}

TEST(InstallationData, ReportsMissingAndUnreadableFiles) {
    EXPECT_EQ(LoadError("<I><CurrentVersion>1</CurrentVersion></I>"), "Failed to read InstallationData file.");
    EXPECT_EQ(LoadError("<I><CurrentVersion></CurrentVersion><PatcherVersion>3</PatcherVersion></I>"),
              "Failed to read InstallationData file.");
    EXPECT_EQ(LoadError("<I><CurrentVersion>1</CurrentVersion>"), "Failed to load InstallationData file.");
    EXPECT_EQ(LoadError(""), "Failed to load InstallationData file.");
    TempFolder empty;
    InstallationData data;
    EXPECT_THROW(data.Load(empty.Path()), Exception);
}

TEST(InstallationData, SplitsTheDigestListIntoPairs) {
    const struct {
        const char* text;
        Hashes expected;
    } cases[] = {
        {"a.dll,0123abcd,b.dll,fedc3210,", {{"a.dll", "0123abcd"}, {"b.dll", "fedc3210"}}},
        {"a.dll,,b.dll,x", {{"a.dll", "b.dll"}}},
        {",,,a,1,,,", {{"a", "1"}}},
        {"a,1,a,2", {{"a", "2"}}},
        {"lonely", {}},
    };
    TempFolder folder;
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        WriteTextFile(folder / "InstallationData.xml",
                      std::string("<I><CurrentVersion>1</CurrentVersion>"
                                  "<PatcherVersion>3</PatcherVersion><InstalledHashes>") +
                          c.text + "</InstalledHashes></I>");
        InstallationData data;
        data.Load(folder.Path());
        EXPECT_EQ(data.installedHashes, c.expected);
    }
}

TEST(InstallationData, WritesTheRecordAsTinyXmlPrintsItAndReadsItBack) {
    TempFolder folder;
    InstallationData data;
    data.SetDirectory(folder.Path());
    data.currentVersion = "-1";
    data.SetPatcherVersion(3.0f);
    data.eulaVersion = "2";
    data.pbEulaVersion = "1";
    data.sku = "Gold & Co";
    data.installedHashes = {{"b", "22"}, {"a", "11"}};
    ASSERT_TRUE(data.Save());
    EXPECT_EQ(ReadTextFile(folder / "InstallationData.xml"),
              WithPlatformLineBreaks("<?xml version=\"1.0\" ?>\n"
                                     "<InstallationData>\n"
                                     "    <CurrentVersion>-1</CurrentVersion>\n"
                                     "    <PatcherVersion>3</PatcherVersion>\n"
                                     "    <EulaVersion>2</EulaVersion>\n"
                                     "    <PbEulaVersion>1</PbEulaVersion>\n"
                                     "    <Sku>Gold &amp; Co</Sku>\n"
                                     "    <InstalledHashes>a,11,b,22,</InstalledHashes>\n"
                                     "</InstallationData>\n"));
    InstallationData again;
    again.Load(folder.Path());
    EXPECT_EQ(again.currentVersion, "-1");
    EXPECT_EQ(again.patcherVersion, "3");
    EXPECT_EQ(again.eulaVersion, "2");
    EXPECT_EQ(again.pbEulaVersion, "1");
    EXPECT_EQ(again.sku, "Gold & Co");
    EXPECT_EQ(again.installedHashes, data.installedHashes);

    // An empty map and label are written empty and read back as such.
    again.installedHashes.clear();
    again.sku.clear();
    ASSERT_TRUE(again.Save());
    InstallationData third;
    third.Load(folder.Path());
    EXPECT_EQ(third.sku, "");
    EXPECT_TRUE(third.installedHashes.empty());
}

TEST(InstallationData, FormatsThePatcherVersionAsAStreamDoes) {
    const struct {
        float number;
        const char* text;
    } cases[] = {{1.0f, "1"}, {1.5f, "1.5"}, {3.0f, "3"}, {0.1f, "0.1"}};
    for (const auto& c : cases) {
        InstallationData data;
        data.SetPatcherVersion(c.number);
        EXPECT_EQ(data.patcherVersion, c.text);
    }
}

TEST(InstallationData, AFailedSaveIsReported) {
    TempFolder folder;
    InstallationData data;
    data.SetDirectory(folder / "missing");
    EXPECT_FALSE(data.Save());
}

}  // namespace
