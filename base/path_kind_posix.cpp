#include <sys/stat.h>

#include "base/path_kind.h"

PathKind KindOf(const std::string& path) {
    struct stat info;
    if (::lstat(path.c_str(), &info) != 0) return PathKind::Missing;
    if (S_ISLNK(info.st_mode)) return PathKind::Link;
    return S_ISDIR(info.st_mode) ? PathKind::Directory : PathKind::File;
}

int64_t FileSizeOf(const std::string& path) {
    struct stat info;
    if (::lstat(path.c_str(), &info) != 0 || !S_ISREG(info.st_mode)) return -1;
    return static_cast<int64_t>(info.st_size);
}

std::string LongPathName(const std::string& path) { return path; }

void ClearReadOnly(const std::string&) {}
