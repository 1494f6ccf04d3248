#include "app/language.h"

#include "text/localization.h"

void SelectStoredLanguage(const std::string& storedName) {
    if (!storedName.empty()) Localization::SetLanguage(storedName.substr(0, storedName.find(' ')));
}
