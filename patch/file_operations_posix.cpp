#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>

#include "patch/file_operations.h"

bool FileExists(const std::string& path) {
    struct stat info;
    return ::stat(path.c_str(), &info) == 0;
}

bool RemoveFile(const std::string& path) {
    struct stat info;
    if (::lstat(path.c_str(), &info) != 0 || S_ISDIR(info.st_mode)) return false;
    return ::unlink(path.c_str()) == 0;
}

bool RenameFile(const std::string& from, const std::string& to) {
    // rename() would replace the target; the Windows move does not.
    if (FileExists(to)) return false;
    return std::rename(from.c_str(), to.c_str()) == 0;
}
