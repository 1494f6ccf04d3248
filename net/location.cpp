#include "net/location.h"

#include "base/paths.h"
#include "base/string_helpers.h"

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
