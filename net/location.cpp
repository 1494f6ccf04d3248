#include "net/location.h"

#include "patch/paths.h"

namespace {

bool StartsWithIgnoringCase(const std::string& text, const char* prefix) {
    size_t i = 0;
    for (; prefix[i] != '\0'; ++i) {
        if (i >= text.size()) return false;
        char c = text[i];
        if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
        if (c != prefix[i]) return false;
    }
    return true;
}

}  // namespace

std::string JoinLocation(const std::string& base, const std::string& tail) {
    if (StartsWithIgnoringCase(base, "http://")) return PathJoin(base, tail, '/');
    // The scheme keeps its slashes, so the result is still a file://
    // address; the path behind it takes the platform's separator.
    if (StartsWithIgnoringCase(base, "file://")) return base.substr(0, 7) + PathJoin(base.substr(7), tail);
    if (IsUncLocation(base)) return PathJoin(base, tail);
    return PathJoin(base, tail, '/');
}

LocationKind ClassifyLocation(const std::string& url) {
    if (StartsWithIgnoringCase(url, "http://")) return LocationKind::Http;
    if (StartsWithIgnoringCase(url, "file://") || IsUncLocation(url)) return LocationKind::FileCopy;
    if (IsRelativeLocation(url)) return LocationKind::Relative;
    return LocationKind::Unsupported;
}

std::string GetCopySource(const std::string& url) {
    return StartsWithIgnoringCase(url, "file://") ? url.substr(7) : url;
}
