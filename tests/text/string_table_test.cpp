#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <tuple>

#include "base/encoding.h"
#include "tests/support/test_files.h"
#include "text/excel_lexicon.h"
#include "text/program_resource.h"

namespace {

// Printf-style placeholders and web addresses, which a translation keeps.
std::vector<std::wstring> Placeholders(const std::wstring& text) {
    static const std::wregex pattern(LR"(%[-+ 0#]*\d*(\.\d+)?[a-zA-Z%]|https?://\S+)");
    return {std::wsregex_token_iterator(text.begin(), text.end(), pattern), std::wsregex_token_iterator()};
}

TEST(StringTableTest, EveryKeyHasATextInEveryLanguage) {
    ResourceBytes bytes;
    ASSERT_TRUE(FindProgramResource("IDS_STRINGS", "CSV", bytes));
    std::u16string units;
    for (size_t i = 0; i + 1 < bytes.size; i += 2)
        units += static_cast<char16_t>(bytes.data[i] | bytes.data[i + 1] << 8);
    std::istringstream rows(NarrowToUtf8(WidenFromUtf16(units.data(), units.size())));
    std::string row;
    std::getline(rows, row);  // the header
    std::set<std::string> keys;
    while (std::getline(rows, row)) {
        EXPECT_EQ(std::count(row.begin(), row.end(), '\t'), 8) << row;
        EXPECT_TRUE(keys.insert(row.substr(0, row.find('\t'))).second) << "twice: " << row;
    }
    // Every key the code asks for, or the user reads "string_not_found_in_lexicon".
    const std::regex use(R"re(Localize\("(\w+)"\))re");
    for (const char* folder : {"base", "text", "patch", "net", "state", "ui", "uninstall", "app"}) {
        for (const auto& file :
             std::filesystem::recursive_directory_iterator(std::string(IRONVALE_SOURCE_DIR "/") + folder)) {
            const std::string text = ReadTextFile(file.path().string());
            for (std::sregex_iterator it(text.begin(), text.end(), use), end; it != end; ++it) {
                EXPECT_EQ(keys.count((*it)[1]), 1u) << (*it)[1] << " in " << file.path();
            }
        }
    }
    ExcelLexicon english;
    ASSERT_TRUE(english.Load("ENG_US", "IDS_STRINGS", "CSV"));
    for (const char* code : {"ENG_US", "FRE_FR", "GER_DE", "ITA_IT", "JPN_JP", "POL_PL", "RUS_RU", "SPA_ES"}) {
        ExcelLexicon lexicon;
        ASSERT_TRUE(lexicon.Load(code, "IDS_STRINGS", "CSV")) << code;
        for (const std::string& key : keys) {
            const std::wstring& text = lexicon.Find(key);
            ASSERT_NE(text, ExcelLexicon::NotFoundText()) << code << " " << key;
            EXPECT_TRUE(!text.empty() && text.front() != L' ' && text.back() != L' ') << code << " " << key;
            EXPECT_EQ(text.find(L"{LINEBREAK"), std::wstring::npos) << code << " " << key;
            EXPECT_EQ(Placeholders(text), Placeholders(english.Find(key))) << code << " " << key;
        }
    }
}

// The built-in table holds no line break markers and no surrogate pairs. A table without a column for the language
// leaves the lexicon empty, whatever was read before.
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
