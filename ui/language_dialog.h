#pragma once

#include <string>
#include <vector>

// Asks the player which of the updater's languages to speak, with the
// current language preselected. Windows: the modal dialog 134 without an
// owner; POSIX: a numbered list on the terminal, answered on stdin. The
// caller selects and stores the choice.
class LanguageDialog {
public:
    LanguageDialog();
    virtual ~LanguageDialog() = default;

    // True when the player confirmed; name is then the chosen language
    // (empty when no entry was selected). False when cancelled or when the
    // dialog could not be shown.
    bool Run(std::string& name);

    // The names shown, in the language table's order.
    const std::vector<std::string>& GetNames() const { return names; }
    // The position of the current language in GetNames(), or -1.
    int CurrentIndex() const;
    // The name at that position in GetNames(); empty when out of range.
    std::string NameAt(long long index) const;

private:
    std::string chosenName;
    std::vector<std::string> names;
};
