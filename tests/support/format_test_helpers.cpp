#include "tests/support/format_test_helpers.h"

#include "base/xml_file.h"

std::string WithPlatformLineBreaks(const std::string& text) {
    std::string result;
    for (char c : text) result += c == '\n' ? std::string(kXmlLineBreak) : std::string(1, c);
    return result;
}
