#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/log_file.h"

namespace {
int file = -1;
}  // namespace

namespace LogFile {

bool IsOpen() { return file >= 0; }

bool Open(const std::string& path, bool truncate) {
    const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    if (fd < 0) return false;
    // Exclusive like the Windows build: a second instance gets no log.
    if (flock(fd, LOCK_EX | LOCK_NB) != 0 || (truncate && ftruncate(fd, 0) != 0)) {
        ::close(fd);
        return false;
    }
    file = fd;
    return true;
}

void Close() {
    if (file >= 0) ::close(file);
    file = -1;
}

bool Size(int64_t& size) {
    struct stat info;
    if (fstat(file, &info) != 0) return false;
    size = info.st_size;
    return true;
}

void Append(const std::string& bytes) {
    // O_APPEND makes the single write land at the end atomically.
    const ssize_t ignored = ::write(file, bytes.data(), bytes.size());
    (void)ignored;
}

}  // namespace LogFile
