#include "text/excel_lexicon.h"

#include <gtest/gtest.h>

#include <string>
#include <tuple>

namespace {

// The built-in table is read in every language by the string table test; it holds no line break markers and no
// surrogate pairs. Here: a table without a column for the language leaves the lexicon empty, whatever was read before.
TEST(ExcelLexiconTest, NoUsableColumnLeavesAnEmptyLexicon) {
    const std::u16string table =
        u"\uFEFF \tENG_US\tGER_DE\r\nKEY_PLAIN\tHello\tHallo\r\nKEY_ODD\tA\t1{LINEBREAK}\U0001F600 {LINEBREAK\r\n";
    const std::tuple<std::string, std::u16string, bool> cases[] = {
        {"SPA_ES", table, false},
        {"keys", u"KEYS\tENG_US\r\nKEY_PLAIN\tHello\r\n", false},  // the first cell names no language
        {"ENG_US", u"\r\n\r\n", false},
        {"ENG_US", u"\uFEFF \tENG_US\r\n", true},
    };
    for (const auto& [code, text, loads] : cases) {
        ExcelLexicon lexicon;
        ASSERT_TRUE(lexicon.LoadFromUnits("ger_de", table.data(), table.size()));  // codes ignore case
        EXPECT_EQ(lexicon.Find("KEY_ODD"), L"1\n\U0001F600 {LINEBREAK");
        EXPECT_EQ(lexicon.LoadFromUnits(code, text.data(), text.size()), loads) << code;
        EXPECT_EQ(lexicon.Find("KEY_PLAIN"), ExcelLexicon::NotFoundText()) << code;
    }
}

}  // namespace
