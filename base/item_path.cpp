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

bool IsDeviceName(const std::string& component) {
    // "CON.txt" opens the console just as "CON" does.
    const std::string stem = ToLowerAscii(component.substr(0, component.find('.')));
    static const char* const kDevices[] = {"con", "prn", "aux", "nul"};
    for (const char* device : kDevices) {
        if (stem == device) return true;
    }
    return stem.size() == 4 && (stem.compare(0, 3, "com") == 0 || stem.compare(0, 3, "lpt") == 0) && stem[3] >= '1' &&
           stem[3] <= '9';
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
