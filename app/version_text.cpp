#include "app/version_text.h"

const char* const kPatchBaseVersion = "515195";

std::string PatchName(const std::string& baseVersion, const std::string& latestVersion) {
    return "patch_" + baseVersion + "_" + latestVersion;
}

std::string BuildName(const std::string& latestVersion) { return "build_" + latestVersion; }

std::string FirstWord(const std::string& text) {
    // An editor's byte-order mark would otherwise become part of every
    // patch name asked for, and no such patch ever exists.
    const size_t mark = text.compare(0, 3, "\xEF\xBB\xBF") == 0 ? 3 : 0;
    const char* const blanks = " \t\r\n";
    const size_t start = text.find_first_not_of(blanks, mark);
    if (start == std::string::npos) return "";
    return text.substr(start, text.find_first_of(blanks, start) - start);
}

namespace {

bool IsWholeNumber(const std::string& text) {
    return !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
}

// Any length: leading zeros go, then the longer number is the larger.
bool NumberIsLess(const std::string& a, const std::string& b) {
    const std::string x = a.substr(std::min(a.find_first_not_of('0'), a.size()));
    const std::string y = b.substr(std::min(b.find_first_not_of('0'), b.size()));
    return x.size() != y.size() ? x.size() < y.size() : x < y;
}

}  // namespace

bool IsOlderVersion(const std::string& installed, const std::string& latest) {
    if (IsWholeNumber(installed) && IsWholeNumber(latest)) return NumberIsLess(installed, latest);
    return installed < latest;
}
