#include "base/item_path.h"

#include <cstring>

#include "base/string_helpers.h"

namespace {

std::vector<std::string> SplitComponents(const std::string& path) {
    std::vector<std::string> components;
    size_t start = 0;
    for (;;) {
        const size_t end = path.find_first_of("/\\", start);
        components.push_back(path.substr(start, end == std::string::npos ? std::string::npos : end - start));
        if (end == std::string::npos) return components;
        start = end + 1;
    }
}

// The port numbers Windows takes after COM and LPT: 0-9 and the
// superscripts one to three, as the system code page writes them (one
// byte) and as UTF-8 does (two).
bool IsPortNumber(const std::string& text) {
    if (text.size() == 1) {
        const auto byte = static_cast<unsigned char>(text[0]);
        return (byte >= '0' && byte <= '9') || byte == 0xB9 || byte == 0xB2 || byte == 0xB3;
    }
    return text == "\xC2\xB9" || text == "\xC2\xB2" || text == "\xC2\xB3";
}

bool IsDeviceName(const std::string& component) {
    // "CON.txt" opens the console just as "CON" does, and so do "CON .txt"
    // and "CON..txt": Windows drops the blanks and dots that end the stem.
    std::string stem = ToLowerAscii(component.substr(0, component.find('.')));
    stem.erase(stem.find_last_not_of(' ') + 1);
    static const char* const kDevices[] = {"con", "prn", "aux", "nul", "conin$", "conout$"};
    for (const char* device : kDevices) {
        if (stem == device) return true;
    }
    return (stem.compare(0, 3, "com") == 0 || stem.compare(0, 3, "lpt") == 0) && IsPortNumber(stem.substr(3));
}

bool IsSafeComponent(const std::string& component) {
    if (component.empty() || component == "." || component == "..") return false;
    if (component.back() == '.' || component.back() == ' ') return false;
    for (const char c : component) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x20 || std::strchr("*?<>|\":", c) != nullptr) return false;
    }
    return !IsDeviceName(component);
}

// True when the first components of path are those of prefix.
bool StartsWithComponents(const std::vector<std::string>& path, const std::vector<std::string>& prefix) {
    if (prefix.size() > path.size()) return false;
    for (size_t i = 0; i < prefix.size(); ++i) {
        if (!EqualsIgnoringCase(path[i], prefix[i])) return false;
    }
    return true;
}

}  // namespace

bool IsSafeItemPath(const std::string& path, const std::vector<std::string>& ownNames) {
    // A leading separator (a root or a UNC prefix) shows as an empty first
    // component; a drive letter as a colon.
    const std::vector<std::string> components = SplitComponents(path);
    for (const std::string& component : components) {
        if (!IsSafeComponent(component)) return false;
    }
    for (const std::string& own : ownNames) {
        if (!own.empty() && StartsWithComponents(components, SplitComponents(own))) return false;
    }
    return true;
}
