#include "net/location.h"

#include "base/paths.h"
#include "base/string_helpers.h"

std::string JoinLocation(const std::string& base, const std::string& tail) {
    if (StartsWithIgnoringCase(base, "http://")) return PathJoin(base, tail, '/');
    // The scheme keeps its slashes, so the result is still a file://
    // address; the path behind it takes the platform's separator.
    if (StartsWithIgnoringCase(base, "file://")) return base.substr(0, 7) + PathJoin(base.substr(7), tail);
    if (IsUncLocation(base)) return PathJoin(base, tail);
    // An empty base (the built-in locations) leaves the tail relative to
    // the program's folder, not rooted at "/", which POSIX would take for
    // the root of the file system.
    const std::string joined = PathJoin(base, tail, '/');
    return base.empty() ? joined.substr(1) : joined;
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
