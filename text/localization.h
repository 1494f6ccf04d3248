#pragma once

#include <string>
#include <vector>

// A language the updater speaks: the name the registry stores and the
// dialog shows, and the column code of the string table.
struct LanguageEntry {
    std::string name;
    std::string code;
};

// Language selection and text lookup, process-wide.
namespace Localization {
// Builds the language table, selects English and loads the fallback.
// Later calls do nothing.
void Initialize();
// Selects the language of that exact name; an unknown name changes nothing.
void SetLanguage(const std::string& name);
// Throws Exception("No language set.") before Initialize.
const LanguageEntry& GetCurrentLanguage();
std::vector<std::string> GetLanguageNames();
}  // namespace Localization

// The text of key in the current language; an empty cell falls back to
// English, a missing key gives "string_not_found_in_lexicon".
const std::wstring& Localize(const std::string& key);
// "<game name> - <updater header>", fixed at its first use.
const std::wstring& GetWindowTitle();
