#include <cstdlib>

#include "base/paths.h"

const char kPathSeparator = '/';

std::string GetTempDirectory() {
    const char* tmp = std::getenv("TMPDIR");
    std::string folder = (tmp != nullptr && *tmp != '\0') ? tmp : "/tmp";
    if (folder.back() != '/') folder += '/';
    return folder;
}
