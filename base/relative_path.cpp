#include "base/relative_path.h"

bool IsContainedRelativePath(const std::string& path) {
    if (path.empty() || path[0] == '/' || path[0] == '\\') return false;
    // A colon names a drive (C:x) or an alternate data stream; neither
    // belongs in a relative file name.
    if (path.find(':') != std::string::npos) return false;
    size_t start = 0;
    while (start <= path.size()) {
        size_t end = path.find_first_of("/\\", start);
        if (end == std::string::npos) end = path.size();
        // ".." and, because Windows drops trailing dots and spaces from a
        // name, anything made of dots and spaces only (".. ", "...").
        const std::string component = path.substr(start, end - start);
        if (!component.empty() && component.find_first_not_of(". ") == std::string::npos && component != ".") {
            return false;
        }
        start = end + 1;
    }
    return true;
}
