#include <iostream>
#include <string>

#include "base/encoding.h"
#include "base/string_helpers.h"
#include "text/localization.h"
#include "ui/language_dialog.h"

namespace {

// The line without its line end and surrounding blanks.
std::string Trim(std::string text) {
    while (!text.empty() && (text.back() == '\r' || text.back() == ' ')) text.pop_back();
    const size_t start = text.find_first_not_of(' ');
    return start == std::string::npos ? std::string() : text.substr(start);
}

}  // namespace

// The list, numbered from 1; the answer is a number or a name (any case),
// an empty line keeps the current language and end of input cancels.
bool LanguageDialog::Run(std::string& name) {
    const int current = CurrentIndex();
    std::cerr << NarrowToUtf8(GetWindowTitle()) << "\nSelect preferred language:\n";
    for (size_t i = 0; i < names.size(); ++i) {
        std::cerr << "  " << i + 1 << ") " << names[i] << (static_cast<int>(i) == current ? " (current)" : "") << "\n";
    }
    for (;;) {
        std::cerr << "Language [" << NameAt(current) << "]: ";
        std::cerr.flush();
        std::string answer;
        if (!std::getline(std::cin, answer)) return false;
        answer = Trim(answer);
        long long index = -1;
        if (answer.empty()) {
            index = current;
        } else if (answer.find_first_not_of("0123456789") == std::string::npos && answer.size() < 4) {
            index = std::stoll(answer) - 1;
        } else {
            for (size_t i = 0; i < names.size(); ++i) {
                if (ToLowerAscii(names[i]) == ToLowerAscii(answer)) index = static_cast<long long>(i);
            }
        }
        if (index >= 0 && static_cast<size_t>(index) < names.size()) {
            chosenName = names[static_cast<size_t>(index)];
            name = chosenName;
            return true;
        }
        std::cerr << "Please answer with a number from 1 to " << names.size() << " or a language name.\n";
    }
}
