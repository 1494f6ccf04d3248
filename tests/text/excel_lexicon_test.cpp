#include "text/excel_lexicon.h"

#include <gtest/gtest.h>

#include <string>
#include <tuple>

namespace {

using namespace std::string_literals;

// Header: a space in the first cell, then the language codes.
const std::u16string kTable =
    u"\uFEFF \tENG_US\tGER_DE\r\n"
    u"KEY_PLAIN\tHello\tHallo\r\n"
    u"KEY_EMPTY\tOnly English\t\r\n"
    u"\r\n"
    u"KEY_BREAKS\tOne{LINEBREAK}{LINEBREAK}Two\tEins{LINEBREAK}Zwei {LINEBREAK\r\n"
    u"KEY_SPACES\t  leading and trailing  \t   x \r\n"
    u"KEY_SHORT\tshort row\r\n"
    u"KEY_WIDE\t\u00C9t\u00E9 \U0001F600\t\u65E5\u672C\r\n"
    u"KEY_NUL\tbefore\0after\tvorher\r\n"
    u"KEY_LAST\tno line end\tohne Zeilenende"s;

TEST(ExcelLexiconTest, ReadsTheColumnOfTheRequestedLanguage) {
    const std::wstring missing = ExcelLexicon::NotFoundText();
    const std::tuple<const char*, std::wstring, std::wstring> cases[] = {
        {"KEY_PLAIN", L"Hello", L"Hallo"},
        {"KEY_EMPTY", L"Only English", L""},  // empty, not missing: Localize falls back to English
        {"KEY_BREAKS", L"One\n\nTwo", L"Eins\nZwei {LINEBREAK"},
        {"KEY_SPACES", L"leading and trailing  ", L"x "},
        {"KEY_SHORT", L"short row", L""},
        {"KEY_WIDE", L"\u00C9t\u00E9 \U0001F600", L"\u65E5\u672C"},
        {"KEY_NUL", L"before", L""},  // a zero unit ends the line
        {"KEY_LAST", L"no line end", L"ohne Zeilenende"},
        {"KEY_MISSING", missing, missing},
        {"Key_Plain", missing, missing},
    };
    ExcelLexicon english, german;
    ASSERT_TRUE(english.LoadFromUnits("ENG_US", kTable.data(), kTable.size()));
    ASSERT_TRUE(german.LoadFromUnits("ger_de", kTable.data(), kTable.size()));  // codes ignore case
    for (const auto& [key, inEnglish, inGerman] : cases) {
        EXPECT_EQ(english.Find(key), inEnglish) << key;
        EXPECT_EQ(german.Find(key), inGerman) << key;
    }
}

TEST(ExcelLexiconTest, NoUsableColumnLeavesAnEmptyLexicon) {
    const std::tuple<std::string, std::u16string, bool> cases[] = {
        {"SPA_ES", kTable, false},
        {"keys", u"KEYS\tENG_US\r\nKEY_PLAIN\tHello\r\n", false},  // the first cell names no language
        {"", kTable, false},
        {"ENG_US", u"", false},
        {"ENG_US", u"\r\n\r\n", false},
        {"ENG_US", u"\uFEFF \tENG_US\r\n", true},
    };
    for (const auto& [code, table, loads] : cases) {
        ExcelLexicon lexicon;
        // A failed load must not keep what an earlier one read.
        ASSERT_TRUE(lexicon.LoadFromUnits("ENG_US", kTable.data(), kTable.size()));
        EXPECT_EQ(lexicon.LoadFromUnits(code, table.data(), table.size()), loads) << code;
        EXPECT_EQ(lexicon.Find("KEY_PLAIN"), ExcelLexicon::NotFoundText()) << code;
    }
}

}  // namespace
