#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/log_file.h"
#include "base/own_file_posix.h"
#include "base/unique_handle_posix.h"

namespace {
UniqueFileDescriptor file;
}  // namespace

namespace LogFile {

bool IsOpen() { return file.IsValid(); }

bool Open(const std::string& path, bool truncate) {
    UniqueFileDescriptor opened = OpenOwnFile(path, O_WRONLY | O_APPEND);
    if (!opened) return false;
    // Exclusive like the Windows build: a second instance gets no log.
    if (flock(opened.Get(), LOCK_EX | LOCK_NB) != 0 || (truncate && ftruncate(opened.Get(), 0) != 0)) return false;
    file = std::move(opened);
    return true;
}

void Close() { file.Reset(); }

bool Size(int64_t& size) {
    struct stat info;
    if (fstat(file.Get(), &info) != 0) return false;
    size = info.st_size;
    return true;
}

void Append(const std::string& bytes) {
    // O_APPEND makes the single write land at the end atomically.
    const ssize_t ignored = ::write(file.Get(), bytes.data(), bytes.size());
    (void)ignored;
}

}  // namespace LogFile
