#include "base/own_file_posix.h"

#include <fcntl.h>
#include <sys/stat.h>

UniqueFileDescriptor OpenOwnFile(const std::string& path, int flags) {
    // Created here, or opened as it is: a link in its place fails either way.
    UniqueFileDescriptor file(::open(path.c_str(), flags | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0644));
    if (!file) file.Reset(::open(path.c_str(), flags | O_NOFOLLOW | O_CLOEXEC));
    struct stat info;
    if (!file || ::fstat(file.Get(), &info) != 0 || !S_ISREG(info.st_mode) || info.st_uid != ::geteuid()) {
        return UniqueFileDescriptor();
    }
    return file;
}
