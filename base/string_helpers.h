#pragma once

#include <string>
#include <string_view>

// Letter case of ASCII only. Switches, URL schemes, lexicon keys and
// registry names are ASCII, and no locale may change what they match.
char ToLowerAscii(char c);
std::string ToLowerAscii(std::string_view text);
bool EqualsIgnoringCase(std::string_view a, std::string_view b);
bool StartsWithIgnoringCase(std::string_view text, std::string_view prefix);
