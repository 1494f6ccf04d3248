#include "base/path_kind.h"

#include "base/paths.h"

std::string FirstLinkBelow(const std::string& root, const std::string& relative, bool includeLast) {
    std::string path = root;
    size_t start = 0;
    for (;;) {
        const size_t end = relative.find_first_of("/\\", start);
        const bool last = end == std::string::npos;
        if (last && !includeLast) return "";
        path = PathJoin(path, relative.substr(start, last ? std::string::npos : end - start));
        if (KindOf(path) == PathKind::Link) return path;
        if (last) return "";
        start = end + 1;
    }
}
