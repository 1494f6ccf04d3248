#pragma once

#include <string>

#include "base/xml_file.h"

// Expected XML written with "\n" turned into this platform's line break.
inline std::string WithPlatformLineBreaks(const std::string& text) {
    std::string result;
    for (char c : text) result += c == '\n' ? std::string(kXmlLineBreak) : std::string(1, c);
    return result;
}
