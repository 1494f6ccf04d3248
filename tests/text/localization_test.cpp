// Language selection over the built-in string table.
#include "text/localization.h"

#include <gtest/gtest.h>

#include "base/exception.h"

namespace {

// One test: the module is process-wide and its window title is fixed at
// its first use, so the order of the steps matters.
TEST(LocalizationTest, SelectionFallbackAndTitle) {
    EXPECT_THROW(Localization::GetCurrentLanguage(), Exception);
    Localization::SetLanguage("German");  // before the table exists: nothing
    EXPECT_THROW(Localization::GetCurrentLanguage(), Exception);

    Localization::Initialize();
    EXPECT_EQ(Localization::GetCurrentLanguage().name, "English");
    EXPECT_EQ(Localization::GetCurrentLanguage().code, "ENG_US");
    const std::vector<std::string> names = {"English",  "French", "German",  "Italian",
                                            "Japanese", "Polish", "Russian", "Spanish"};
    EXPECT_EQ(Localization::GetLanguageNames(), names);
    EXPECT_EQ(Localize("INSTALLER_DIALOG_CANCEL"), L"Cancel");
    EXPECT_EQ(GetWindowTitle(), L"Ironvale - Updater");

    for (const char* unknown : {"english", "GERMAN", "Deutsch", ""}) {
        Localization::SetLanguage(unknown);
        EXPECT_EQ(Localization::GetCurrentLanguage().name, "English") << unknown;
    }

    Localization::SetLanguage("German");
    EXPECT_EQ(Localization::GetCurrentLanguage().code, "GER_DE");
    EXPECT_EQ(Localize("INSTALLER_DIALOG_CANCEL"), L"Abbrechen");
    EXPECT_EQ(Localize("INSTALLER_NO_SUCH_KEY"), L"string_not_found_in_lexicon");
    EXPECT_EQ(GetWindowTitle(), L"Ironvale - Updater");

    // A second Initialize changes nothing.
    Localization::Initialize();
    EXPECT_EQ(Localization::GetCurrentLanguage().name, "German");

    Localization::SetLanguage("Japanese");
    EXPECT_EQ(Localize("INSTALLER_DIALOG_YES"), L"\u306F\u3044");
    EXPECT_EQ(Localize("INSTALLER_NO_SUCH_KEY"), L"string_not_found_in_lexicon");
}

}  // namespace
