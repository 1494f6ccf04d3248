// The built-in string table itself: its bytes, its keys, and that every
// language says something for every key.
#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <map>
#include <regex>
#include <string>
#include <vector>

#include "base/encoding.h"
#include "text/excel_lexicon.h"
#include "text/program_resource.h"

namespace {

const char* const kCodes[] = {"ENG_US", "FRE_FR", "GER_DE", "ITA_IT", "JPN_JP", "POL_PL", "RUS_RU", "SPA_ES"};

// In table order.
// clang-format off
const char* const kKeys[] = {
    "INSTALLER_CHECKING_INSTALLATION", "INSTALLER_CONFIRM_CANCEL", "INSTALLER_CONFIRM_QUIT",
    "INSTALLER_COULD_NOT_CREATE", "INSTALLER_COULD_NOT_CREATE_DIRECTORY", "INSTALLER_DIALOG_CANCEL",
    "INSTALLER_DIALOG_OK", "INSTALLER_DIALOG_RETRY", "INSTALLER_INSTALLING_STATUS", "INSTALLER_POWERUSER_NOT_ENOUGH",
    "INSTALLER_UAC_IS_OFF", "INSTALLER_UAC_TURN_ON", "INSTALLER_PATCHING_AND_DOWNLOADING_STATUS",
    "INSTALLER_REINSTALLING_STATUS", "INSTALLER_RETRIEVING_VERSION_STATUS", "INSTALLER_UNSUPPORTED_OS",
    "INSTALLER_WINDOW_FILE", "INSTALLER_WRONG_DIRECTXVERSION", "INSTALLER_UPDATE_DIRECTXVERSION",
    "INSTALLER_START_GAME", "INSTALLER_SUCCESS_PATCH", "INSTALLER_SUCCESS_INSTALL", "INSTALLER_PATCH_CURRENT_VERSION",
    "INSTALLER_PATCH_LATEST_VERSION", "INSTALLER_PATCH_NEED_LATEST_VERSION", "INSTALLER_PATCH_CONFIRM_UPADATE",
    "INSTALLER_UNINSTALLER_HEADER", "INSTALLER_UPDATER_HEADER", "INSTALLER_INSTALLER_HEADER",
    "INSTALLER_CHOOSE_INSTALL_LOCATION", "INSTALLER_ADMINISTRATOR_RIGHTS",
    "INSTALLER_ADMINISTRATOR_RIGHTS_EVERYONE_REQUIRED", "INSTALLER_LOG_ON_AS_ADMINISTRATOR",
    "INSTALLER_FAILED_TO_CREATE_DIRECTORY", "INSTALLER_FAILED_TO_WRITE_TO_DIRECTORY", "INSTALLER_CHECK_ACCESS_RIGHTS",
    "INSTALLER_CHECK_INVALID_CHARACTERS", "INSTALLER_FAILED_TO_MOVE_THE_FILE", "INSTALLER_TO",
    "INSTALLER_BUTTON_BROWSE", "INSTALLER_DIALOG_ACCEPT", "INSTALLER_DIALOG_DECLINE", "INSTALLER_CLOSE_FILES_AND_RETRY",
    "INSTALLER_COMPONENT_INSTALL_FAILED", "INSTALLER_ANYONE_WHO_USES_THIS_COMPUTER", "INSTALLER_ONLY_FOR_ME",
    "INSTALLER_INSTALL_TO", "INSTALLER_INSTALL_REQUIRED_TOOL", "INSTALLER_DIALOG_EULA_CAPTION", "INSTALLER_DIALOG_YES",
    "INSTALLER_DIALOG_NO", "INSTALLER_DIALOG_UNINSTALL", "INSTALLER_DIALOG_FINISH",
    "INSTALLER_UNINSTALL_DO_YOU_WANT_UNINSTALL", "INSTALLER_ADMINISTRATOR_UNINSTALL", "INSTALLER_UNINSTALL_PLEASE_WAIT",
    "INSTALLER_UNINSTALL_SUCCESSFULLY_REMOVED", "INSTALLER_ERROR_NOT_ENOUGH_SPACE", "INSTALLER_REQUIRED_SPACE",
    "INSTALLER_ERROR_FREE_UP_SPACE", "INSTALLER_DIALOG_BACK", "INSTALLER_DIALOG_PBEULA_CAPTION",
    "INSTALLER_INSTALLER_DIALOG_SUCCESS_INSTALL", "INSTALLER_DIALOG_LOCATION",
    "INSTALLER_DIALOG_INSTALL_DEFAULT_SETTINGS", "INSTALLER_NO_INTERNET_CONNECTION",
    "INSTALLER_NEED_INTERNET_CONNECTION", "INSTALLER_ERROR_CONNECTION",
    "INSTALLER_UNINSTALL_REMOVE_OPTIONAL_DIALOG_CAPTION", "INSTALLER_ERROR_HOST_NO_CONFIG", "INSTALLER_ERROR_OCCURRED",
    "INSTALLER_ERROR_WRONG_ARGUMENTS", "INSTALLER_HELP", "INSTALLER_INSTALL_APPLICATION_FOR",
    "INSTALLER_ERROR_CORRUPT_DATA", "INSTALLER_ERROR_REINSTALL", "INSTALLER_ERROR_NO_PATCH_FOUND",
    "INSTALLER_INSTANCE_RUNNING", "INSTALLER_ERROR_PLAY_OLD_VERSION", "INSTALLER_ERROR_FILE_NOT_FOUND",
    "INSTALLER_REMOVE_SAVES_AND_SETTINGS", "INSTALLER_UNINSTALL_REMOVE_OPTIONAL", "INSTALLER_GAME_IS_NOT_INSTALLED",
    "INSTALLER_GAME_NAME", "INSTALLER_INCOMPATIBLE_WITH_STEAM",
};
// clang-format on

std::u16string ResourceUnits() {
    ResourceBytes bytes;
    if (!FindProgramResource("IDS_STRINGS", "CSV", bytes)) return std::u16string();
    std::u16string units;
    for (size_t i = 0; i + 1 < bytes.size; i += 2) {
        units += static_cast<char16_t>(bytes.data[i] | (bytes.data[i + 1] << 8));
    }
    return units;
}

std::vector<std::u16string> Split(const std::u16string& text, const std::u16string& separator) {
    std::vector<std::u16string> parts;
    size_t from = 0;
    size_t found;
    while ((found = text.find(separator, from)) != std::u16string::npos) {
        parts.push_back(text.substr(from, found - from));
        from = found + separator.size();
    }
    parts.push_back(text.substr(from));
    return parts;
}

// What a translation must carry over unchanged: printf-style placeholders
// and web addresses, in order.
std::vector<std::string> Placeholders(const std::wstring& text) {
    static const std::regex pattern(R"(%[-+ 0#]*[0-9]*(\.[0-9]+)?[a-zA-Z%]|https?://[^ ]+)");
    const std::string narrow = NarrowToUtf8(text);
    std::vector<std::string> found;
    for (std::sregex_iterator it(narrow.begin(), narrow.end(), pattern), end; it != end; ++it)
        found.push_back(it->str());
    return found;
}

TEST(StringTableTest, TheResourceIsUtf16WithOneRowPerKey) {
    const std::u16string units = ResourceUnits();
    ASSERT_FALSE(units.empty());
    ASSERT_EQ(units[0], u'\uFEFF');
    ASSERT_EQ(units.substr(units.size() - 2), u"\r\n");
    const std::vector<std::u16string> lines = Split(units.substr(1, units.size() - 3), u"\r\n");
    ASSERT_EQ(lines.size(), 1 + std::size(kKeys));
    EXPECT_EQ(lines[0], u" \tENG_US\tFRE_FR\tGER_DE\tITA_IT\tJPN_JP\tPOL_PL\tRUS_RU\tSPA_ES");
    for (size_t row = 0; row < std::size(kKeys); ++row) {
        const std::vector<std::u16string> cells = Split(lines[row + 1], u"\t");
        EXPECT_EQ(cells.size(), 9u) << kKeys[row];
        const std::u16string key(kKeys[row], kKeys[row] + std::char_traits<char>::length(kKeys[row]));
        EXPECT_EQ(cells[0], key) << "row " << row + 1;
        EXPECT_EQ(lines[row + 1].find(u'\n'), std::u16string::npos) << kKeys[row];
    }
}

TEST(StringTableTest, EveryLanguageHasEveryKeyWithItsPlaceholders) {
    ExcelLexicon english;
    ASSERT_TRUE(english.Load("ENG_US", "IDS_STRINGS", "CSV"));
    for (const char* code : kCodes) {
        ExcelLexicon lexicon;
        ASSERT_TRUE(lexicon.Load(code, "IDS_STRINGS", "CSV")) << code;
        for (const char* key : kKeys) {
            SCOPED_TRACE(std::string(code) + " " + key);
            const std::wstring& text = lexicon.Find(key);
            ASSERT_NE(text, ExcelLexicon::NotFoundText());
            EXPECT_FALSE(text.empty());
            EXPECT_EQ(text.find(L"{LINEBREAK"), std::wstring::npos);
            EXPECT_NE(text.front(), L' ');
            EXPECT_NE(text.back(), L' ');
            EXPECT_EQ(Placeholders(text), Placeholders(english.Find(key)));
        }
    }
}

TEST(StringTableTest, TranslationsDifferFromEnglish) {
    // Where a language rightly keeps the English word.
    const std::map<std::string, std::vector<std::string>> sameAsEnglish = {
        {"INSTALLER_GAME_NAME", {"FRE_FR", "GER_DE", "ITA_IT", "JPN_JP", "POL_PL", "RUS_RU", "SPA_ES"}},
        {"INSTALLER_WINDOW_FILE", {"ITA_IT"}},
        {"INSTALLER_DIALOG_NO", {"ITA_IT", "SPA_ES"}},
    };
    ExcelLexicon english;
    ASSERT_TRUE(english.Load("ENG_US", "IDS_STRINGS", "CSV"));
    for (size_t language = 1; language < std::size(kCodes); ++language) {
        ExcelLexicon lexicon;
        ASSERT_TRUE(lexicon.Load(kCodes[language], "IDS_STRINGS", "CSV"));
        for (const char* key : kKeys) {
            const auto allowed = sameAsEnglish.find(key);
            const bool mayMatch =
                allowed != sameAsEnglish.end() &&
                std::find(allowed->second.begin(), allowed->second.end(), kCodes[language]) != allowed->second.end();
            EXPECT_EQ(lexicon.Find(key) == english.Find(key), mayMatch) << kCodes[language] << " " << key;
        }
    }
}

}  // namespace
