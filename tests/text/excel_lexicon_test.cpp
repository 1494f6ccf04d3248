// The lexicon's reading of a string table, on small tables in memory.
#include "text/excel_lexicon.h"

#include <gtest/gtest.h>

#include <string>

namespace {

// Header: a space in the first cell, then the language codes.
const std::u16string kTable =
    u"\uFEFF \tENG_US\tGER_DE\r\n"
    u"KEY_PLAIN\tHello\tHallo\r\n"
    u"KEY_EMPTY\tOnly English\t\r\n"
    u"\r\n"
    u"KEY_BREAKS\tOne{LINEBREAK}{LINEBREAK}Two\tEins{LINEBREAK}Zwei {LINEBREAK\r\n"
    u"KEY_SPACES\t  leading and trailing  \t   x \r\n"
    u"KEY_EXTRA\tA\tB\tC\tD\r\n"
    u"key_plain\tlower case\tklein\r\n"
    u"KEY_TWICE\tfirst\terste\r\n"
    u"KEY_TWICE\tsecond\tzweite\r\n"
    u"KEY_SHORT\tshort row\r\n"
    u"KEY_WIDE\t\u00C9t\u00E9 \U0001F600\t\u65E5\u672C\r\n"
    u"KEY_LF_ONLY\tno CR\tkein CR\n"
    u"KEY_LAST\tno line end\tohne Zeilenende";

bool Load(ExcelLexicon& lexicon, const std::string& code, const std::u16string& table = kTable) {
    return lexicon.LoadFromUnits(code, table.data(), table.size());
}

TEST(ExcelLexiconTest, ReadsTheColumnOfTheRequestedLanguage) {
    struct Case {
        const char* key;
        const wchar_t* english;
        const wchar_t* german;
    };
    const Case cases[] = {
        {"KEY_PLAIN", L"Hello", L"Hallo"},
        // An empty cell is an empty text, which Localize answers in English;
        // it is not the "not found" text.
        {"KEY_EMPTY", L"Only English", L""},
        {"KEY_BREAKS", L"One\n\nTwo", L"Eins\nZwei {LINEBREAK"},
        {"KEY_SPACES", L"leading and trailing  ", L"x "},
        {"KEY_EXTRA", L"A", L"B"},
        {"key_plain", L"lower case", L"klein"},
        {"KEY_TWICE", L"second", L"zweite"},
        {"KEY_SHORT", L"short row", L""},
        {"KEY_WIDE", L"\u00C9t\u00E9 \U0001F600", L"\u65E5\u672C"},
        {"KEY_LF_ONLY", L"no CR", L"kein CR"},
        {"KEY_LAST", L"no line end", L"ohne Zeilenende"},
        {"KEY_MISSING", L"string_not_found_in_lexicon", L"string_not_found_in_lexicon"},
        {"Key_Plain", L"string_not_found_in_lexicon", L"string_not_found_in_lexicon"},
    };
    ExcelLexicon english;
    ExcelLexicon german;
    ASSERT_TRUE(Load(english, "ENG_US"));
    ASSERT_TRUE(Load(german, "GER_DE"));
    for (const Case& c : cases) {
        EXPECT_EQ(english.Find(c.key), c.english) << c.key;
        EXPECT_EQ(german.Find(c.key), c.german) << c.key;
    }
}

TEST(ExcelLexiconTest, LanguageCodesIgnoreCase) {
    ExcelLexicon lexicon;
    ASSERT_TRUE(Load(lexicon, "eng_us"));
    EXPECT_EQ(lexicon.Find("KEY_PLAIN"), L"Hello");
    ASSERT_TRUE(Load(lexicon, "Ger_De"));
    EXPECT_EQ(lexicon.Find("KEY_PLAIN"), L"Hallo");
}

TEST(ExcelLexiconTest, NoUsableColumnLeavesAnEmptyLexicon) {
    const std::u16string namedFirstCell = u"KEYS\tENG_US\r\nKEY_PLAIN\tHello\r\n";
    const std::u16string headerOnly = u"\uFEFF \tENG_US\r\n";
    struct Case {
        const char* name;
        std::string code;
        std::u16string table;
        bool loads;
    };
    // clang-format off
    const Case cases[] = {
        {"absent code", "SPA_ES", kTable, false},
        {"first header cell", "keys", namedFirstCell, false},
        {"blank first header cell", "", kTable, false},
        {"empty table", "ENG_US", u"", false},
        {"only empty lines", "ENG_US", u"\r\n\r\n", false},
        {"header without rows", "ENG_US", headerOnly, true},
    };
    // clang-format on
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ExcelLexicon lexicon;
        // A failed load must not keep what an earlier one read.
        ASSERT_TRUE(Load(lexicon, "ENG_US"));
        EXPECT_EQ(Load(lexicon, c.code, c.table), c.loads);
        EXPECT_EQ(lexicon.Find("KEY_PLAIN"), ExcelLexicon::NotFoundText());
    }
}

TEST(ExcelLexiconTest, ALineEndsAtAZeroUnit) {
    const std::u16string table =
        std::u16string(u" \tENG_US\r\nKEY_A\tbefore", 22) + u'\0' + u"after\r\nKEY_B\tnext\r\n";
    ExcelLexicon lexicon;
    ASSERT_TRUE(Load(lexicon, "ENG_US", table));
    EXPECT_EQ(lexicon.Find("KEY_A"), L"before");
    EXPECT_EQ(lexicon.Find("KEY_B"), L"next");
}

}  // namespace
