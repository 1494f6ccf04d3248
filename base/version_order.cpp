#include "base/version_order.h"

#include <algorithm>
#include <vector>

namespace {

// The numbers of a dotted version, without leading zeros; false when the
// text is not one.
bool SplitNumbers(const std::string& text, std::vector<std::string>& numbers) {
    size_t start = 0;
    for (;;) {
        const size_t end = std::min(text.find('.', start), text.size());
        const std::string number = text.substr(start, end - start);
        if (number.empty() || number.find_first_not_of("0123456789") != std::string::npos) return false;
        numbers.push_back(number.substr(std::min(number.find_first_not_of('0'), number.size())));
        if (end == text.size()) return true;
        start = end + 1;
    }
}

// Any length: the longer number is the larger.
int CompareNumbers(const std::string& x, const std::string& y) {
    if (x.size() != y.size()) return x.size() < y.size() ? -1 : 1;
    return x.compare(y);
}

}  // namespace

bool IsOlderVersion(const std::string& a, const std::string& b) {
    std::vector<std::string> x;
    std::vector<std::string> y;
    if (!SplitNumbers(a, x) || !SplitNumbers(b, y)) return a < b;
    const size_t count = std::max(x.size(), y.size());
    x.resize(count);
    y.resize(count);
    for (size_t i = 0; i < count; ++i) {
        if (const int order = CompareNumbers(x[i], y[i]); order != 0) return order < 0;
    }
    return false;
}

std::string FirstWord(const std::string& text) {
    // An editor's byte-order mark would otherwise become part of every
    // patch name asked for, and no such patch ever exists.
    const size_t mark = text.compare(0, 3, "\xEF\xBB\xBF") == 0 ? 3 : 0;
    const char* const blanks = " \t\r\n";
    const size_t start = text.find_first_not_of(blanks, mark);
    if (start == std::string::npos) return "";
    return text.substr(start, text.find_first_of(blanks, start) - start);
}
