#include "text/localization.h"

#include <mutex>

#include "base/exception.h"
#include "text/excel_lexicon.h"

namespace {

const char* const kResourceName = "IDS_STRINGS";
const char* const kResourceType = "CSV";

struct State {
    std::vector<LanguageEntry> languages;
    const LanguageEntry* current = nullptr;
    ExcelLexicon lexicon;
    ExcelLexicon fallback;
    bool initialized = false;
};

State& GetState() {
    static State state;
    return state;
}

}  // namespace

namespace Localization {

void Initialize() {
    State& state = GetState();
    if (state.initialized) return;
    state.initialized = true;
    state.languages = {
        {"English", "ENG_US"},  {"French", "FRE_FR"}, {"German", "GER_DE"},  {"Italian", "ITA_IT"},
        {"Japanese", "JPN_JP"}, {"Polish", "POL_PL"}, {"Russian", "RUS_RU"}, {"Spanish", "SPA_ES"},
    };
    SetLanguage("English");
    state.fallback.Load(state.languages.front().code, kResourceName, kResourceType);
}

void SetLanguage(const std::string& name) {
    State& state = GetState();
    for (const LanguageEntry& entry : state.languages) {
        if (entry.name == name) {
            state.current = &entry;
            state.lexicon.Load(entry.code, kResourceName, kResourceType);
            return;
        }
    }
}

const LanguageEntry& GetCurrentLanguage() {
    const State& state = GetState();
    if (state.current == nullptr) throw Exception("No language set.");
    return *state.current;
}

std::vector<std::string> GetLanguageNames() {
    std::vector<std::string> names;
    for (const LanguageEntry& entry : GetState().languages) names.push_back(entry.name);
    return names;
}

}  // namespace Localization

const std::wstring& Localize(const std::string& key) {
    const State& state = GetState();
    const std::wstring& text = state.lexicon.Find(key);
    if (!text.empty()) return text;
    return state.fallback.Find(key);
}

const std::wstring& GetWindowTitle() {
    // The main window and the UI thread's boxes may ask first at the same
    // moment; build it once.
    static std::once_flag once;
    static std::wstring title;
    std::call_once(once,
                   [] { title = Localize("INSTALLER_GAME_NAME") + L" - " + Localize("INSTALLER_UPDATER_HEADER"); });
    return title;
}
