#include "ui/language_dialog.h"

#include "text/localization.h"

LanguageDialog::LanguageDialog() : names(Localization::GetLanguageNames()) {}

int LanguageDialog::CurrentIndex() const {
    const std::string& current = Localization::GetCurrentLanguage().name;
    for (size_t i = 0; i < names.size(); ++i) {
        if (names[i] == current) return static_cast<int>(i);
    }
    return -1;
}

std::string LanguageDialog::NameAt(long long index) const {
    if (index < 0 || static_cast<unsigned long long>(index) >= names.size()) return std::string();
    return names[static_cast<size_t>(index)];
}
