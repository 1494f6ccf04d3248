#pragma once

#include <string>

// Whether version a is older than version b. Versions made of whole
// numbers separated by dots ("9", "1.10", "2.0.3") compare number by
// number, a missing number counting as 0 (1.9 < 1.10 < 2, 2 = 2.0); any
// other text compares byte-wise, as opaque text.
bool IsOlderVersion(const std::string& a, const std::string& b);

// The first word of the latest-version file: a UTF-8 byte-order mark, then
// blanks, tabs and line breaks before it are skipped, and it ends at the
// next one. Empty when the text holds no word.
std::string FirstWord(const std::string& text);
