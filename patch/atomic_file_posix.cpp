#include <fcntl.h>
#include <unistd.h>

#include <cstdio>
#include <string>

#include "patch/paths.h"

bool MoveReplacingDurably(const std::string& from, const std::string& to) {
    if (std::rename(from.c_str(), to.c_str()) != 0) return false;
    // The rename itself is durable only once the folder is synced.
    std::string folder = GetParentDirectory(to);
    if (folder.empty()) folder = ".";
    const int fd = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd >= 0) {
        fsync(fd);
        ::close(fd);
    }
    return true;
}

void RemoveFileQuietly(const std::string& path) { std::remove(path.c_str()); }
