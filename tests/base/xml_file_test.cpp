// The shared XML rules: TinyXML's own output byte for byte, code-page bytes
// kept, hostile files refused before TinyXML's recursive parser could
// overflow the stack, and a failed save that leaves the old file.
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
        {"<a><b x='/>' y=\"<c>\"></b></a>", 2},         // markup inside values
        {"<a><!-- <b><c><d> --><b/></a>", 1},           // markup inside comments
        {"<a><![CDATA[<b><c>]]></a>", 1},               // and CDATA
        {"<a>text &lt; /> more<b>t</b></a>", 2},        // text runs to the next '<'
        {"<a><?xml version='>x' ?><b></b></a>", 2},     // declaration values may hold '>'
        {"<a><!DOCTYPE x><b></b></a>", 2},              // unknown markup ends at '>'
        {"<a/>trailing <b><c><d>", 0},                  // the parser stops at text after the root
        {"<r>&#x</r>x1;<a>&#x</a>x1;<b/></a></r>", 2},  // "&#x" runs to the next ';'
        {"<r>&#</r>#1;<a/></r>", 1},                    // so does "&#"
        {"<r><a b=\"&#x\"/>x1;\"><c/></a></r>", 2},     // even across a quote
        {"<r>&#xz;</r>", -1},                           // a bad reference ends the parse
        {"<a><b>", -1},                                 // unclosed
        {"<a><!-- never closed", -1},
        {"<a b=\"unterminated></a>", -1},
        {"<a b=c\"d\"></a>", -1},  // quote in an unquoted value
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
    // 0xE9 (e acute in Windows-1252) right before the closing quote: read
    // as UTF-8 it would swallow the quote and the rest of the tag.
    ASSERT_TRUE(ParseXml("\xEF\xBB\xBF<r>\r\n<new Path=\"Caf\xE9\" File=\"x\" />\r<v>a</v></r>", document));
    const TiXmlElement* item = document.RootElement()->FirstChildElement("new");
    EXPECT_STREQ(item->Attribute("Path"), "Caf\xE9");
    EXPECT_STREQ(item->Attribute("File"), "x");
    std::string text;
    EXPECT_TRUE(ReadElementText(document.RootElement(), "v", text));
    EXPECT_EQ(text, "a");
}

TEST(LoadXmlFile, RefusesFilesLargerThanAnyRecord) {
    TempFolder folder;
    const std::string path = folder / "big.xml";
    WriteTextFile(path, "<r/>");
    TiXmlDocument document;
    EXPECT_TRUE(LoadXmlFile(path, document));
    std::filesystem::resize_file(path, kMaximumXmlFileSize + 1);
    EXPECT_FALSE(LoadXmlFile(path, document));
    EXPECT_FALSE(LoadXmlFile(folder / "missing.xml", document));
}

TEST(SaveXmlFile, WritesExactlyWhatTinyXmlsSaveFileWrites) {
    TempFolder folder;
    TiXmlDocument document;
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
}

TEST(SaveXmlFile, AFailedWriteKeepsTheOldFileAndNoTemporary) {
    TempFolder folder;
    TiXmlDocument document;
    StartXmlDocument(document);
    WriteTextFile(folder / "x.xml", "old");
    // The temporary cannot be made: its folder is missing, or a folder has its name.
    std::filesystem::create_directory(folder / "busy.tmp");
    EXPECT_FALSE(SaveXmlFile(document, folder / "x.xml", PathJoin(folder / "missing", "x.tmp")));
    EXPECT_FALSE(SaveXmlFile(document, folder / "x.xml", folder / "busy.tmp"));
    EXPECT_EQ(ReadTextFile(folder / "x.xml"), "old");
    // The temporary is written but cannot take the place of a folder.
    std::filesystem::create_directories(PathJoin(folder / "record", "inside"));
    EXPECT_FALSE(ReplaceFileAtomically(folder / "record", "new"));
    EXPECT_FALSE(PathExists(folder / "~record.tmp"));
}

}  // namespace
