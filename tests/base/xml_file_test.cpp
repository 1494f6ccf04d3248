// The shared XML rules: TinyXML's own output byte for byte, code-page bytes kept, hostile files refused before
// TinyXML's recursive parser could overflow the stack, and a failed save that leaves the old file.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <utility>

#include "base/atomic_file.h"
#include "base/paths.h"
#include "base/xml_file.h"
#include "base/xml_nesting.h"
#include "tests/support/test_files.h"

namespace {

TEST(MeasureXmlNesting, CountsOpenElementsTheWayTheParserSeesThem) {
    const std::pair<const char*, int> cases[] = {
        {"<a/>", 0},
        {"<?xml version=\"1.0\" ?><a><b><c/></b></a>", 2},
        {"<a><!-- <b><c><d> --><b/></a>", 1},           // markup inside comments
        {"<a><![CDATA[<b><c>]]></a>", 1},               // and CDATA
        {"<r>&#x</r>x1;<a>&#x</a>x1;<b/></a></r>", 2},  // "&#x" runs to the next ';'
        {"<r>&#xz;</r>", -1},                           // a bad reference ends the parse
        {"<a b=c\"d\"></a>", -1},                       // quote in an unquoted value
        {"<a><b>", -1},                                 // unclosed
    };
    int64_t nodes = 0;
    for (const auto& [text, depth] : cases) EXPECT_EQ(MeasureXmlNesting(text, 10, nodes), depth) << text;
    EXPECT_EQ(MeasureXmlNesting("<a><b><c></c></b></a>", 2, nodes), -1);
    // Elements, attributes, text and comments each count.
    EXPECT_EQ(MeasureXmlNesting("<a x='1' y='2'>t<b/><!-- c --></a>", 10, nodes), 1);
    EXPECT_EQ(nodes, 6);
}

TEST(ParseXml, RefusesHostileTextsAndKeepsCodePageBytes) {
    std::string deep, hidden = "<r>", flat = "<r>";
    for (int i = 0; i < 200000; ++i) deep += "<a>";
    for (int i = 0; i < 200000; ++i) hidden += "<a x='/>'><!-- </a> -->";
    for (int64_t i = 0; i < kMaximumXmlNodes; ++i) flat += "<a/>";
    TiXmlDocument document;
    for (const std::string& text : {deep, hidden, flat + "</r>", std::string("<r>a\0b</r>", 10), std::string(),
                                    std::string("<!-- only a comment -->"), std::string("<r><a></b></r>")}) {
        EXPECT_FALSE(ParseXml(text, document)) << text.substr(0, 40);
    }
    // 0xE9 (e acute in Windows-1252) right before the closing quote: read as UTF-8 it would swallow the quote and the
    // rest of the tag.
    ASSERT_TRUE(ParseXml("\xEF\xBB\xBF<r>\r\n<new Path=\"Caf\xE9\" File=\"x\" />\r<v>a</v></r>", document));
    const TiXmlElement* item = document.RootElement()->FirstChildElement("new");
    EXPECT_STREQ(item->Attribute("Path"), "Caf\xE9");
    EXPECT_STREQ(item->Attribute("File"), "x");
    std::string text;
    EXPECT_TRUE(ReadElementText(document.RootElement(), "v", text));
    EXPECT_EQ(text, "a");
}

TEST(XmlFiles, LoadRefusesHugeFilesAndSaveReplacesWholeOrNotAtAll) {
    TempFolder folder;
    TiXmlDocument loaded, document;
    WriteTextFile(folder / "big.xml", "<r/>");
    EXPECT_TRUE(LoadXmlFile(folder / "big.xml", loaded));
    std::filesystem::resize_file(folder / "big.xml", kMaximumXmlFileSize + 1);
    EXPECT_FALSE(LoadXmlFile(folder / "big.xml", loaded));
    EXPECT_FALSE(LoadXmlFile(folder / "missing.xml", loaded));

    StartXmlDocument(document);
    TiXmlNode* root = document.InsertEndChild(TiXmlElement("Root"));
    root->ToElement()->SetAttribute("Path", "a&b <c> \"d\" 'e'");
    root->InsertEndChild(TiXmlElement("List"))->InsertEndChild(TiXmlElement("Empty"));
    AppendTextElement(root, "Text", "x & y < z");
    AppendTextElement(root, "Blank", "");
    WriteTextFile(folder / "ours.xml", std::string(4096, 'x'));  // replaced whole
    ASSERT_TRUE(SaveXmlFile(document, folder / "ours.xml"));
    ASSERT_TRUE(document.SaveFile((folder / "tinyxml.xml").c_str()));
    EXPECT_EQ(ReadTextFile(folder / "ours.xml"), ReadTextFile(folder / "tinyxml.xml"));
    EXPECT_FALSE(PathExists(folder / "~ours.xml.tmp"));

    // The temporary cannot be made: its folder is missing, or a folder has its name.
    std::filesystem::create_directory(folder / "busy.tmp");
    EXPECT_FALSE(SaveXmlFile(document, folder / "ours.xml", PathJoin(folder / "missing", "x.tmp")));
    EXPECT_FALSE(SaveXmlFile(document, folder / "ours.xml", folder / "busy.tmp"));
    EXPECT_EQ(ReadTextFile(folder / "ours.xml"), ReadTextFile(folder / "tinyxml.xml"));
    // The temporary is written but cannot take the place of a folder.
    std::filesystem::create_directories(PathJoin(folder / "record", "inside"));
    EXPECT_FALSE(ReplaceFileAtomically(folder / "record", "new"));
    EXPECT_FALSE(PathExists(folder / "~record.tmp"));
}

}  // namespace
