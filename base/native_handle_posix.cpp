#include "base/native_handle.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "base/unique_handle_posix.h"

// Windows' sharing modes are mirrored with flock: writers hold an exclusive
// lock, readers a shared one, so a writer and a reader exclude each other
// just as CreateFileA's share flags make them.
void NativeHandle::Traits::Close(intptr_t value) { ::close(static_cast<int>(value)); }

bool NativeHandle::Open(const std::string& path, Mode mode) {
    Close();
    int flags = O_CLOEXEC;
    int lock = LOCK_EX;
    switch (mode) {
        case Mode::CreateAlways:
            flags |= O_WRONLY | O_CREAT;
            break;
        case Mode::OpenRead:
            flags |= O_RDONLY;
            lock = LOCK_SH;
            break;
        case Mode::OpenAlways:
            flags |= O_WRONLY | O_CREAT;
            break;
    }
    UniqueFileDescriptor opened(::open(path.c_str(), flags, 0644));
    const int fd = opened.Get();
    if (fd < 0) return false;
    struct stat info;
    if (fstat(fd, &info) != 0 || S_ISDIR(info.st_mode) || flock(fd, lock | LOCK_NB) != 0) return false;
    // Truncate only once the lock is ours, so a refused open leaves the
    // other holder's file intact.
    if (mode == Mode::CreateAlways && ftruncate(fd, 0) != 0) return false;
    file.Reset(opened.Release());
    return true;
}

bool NativeHandle::Seek(int64_t offset, uint32_t origin, int64_t& newPosition) {
    if (!IsOpen() || origin > 2) return false;
    static const int kWhence[] = {SEEK_SET, SEEK_CUR, SEEK_END};
    const off_t result = lseek(static_cast<int>(file.Get()), static_cast<off_t>(offset), kWhence[origin]);
    if (result < 0) return false;
    newPosition = result;
    return true;
}

bool NativeHandle::Length(int64_t& length) {
    struct stat info;
    if (!IsOpen() || fstat(static_cast<int>(file.Get()), &info) != 0) return false;
    length = info.st_size;
    return true;
}

bool NativeHandle::Read(void* destination, uint32_t count, uint32_t& done) {
    done = 0;
    if (!IsOpen()) return false;
    ssize_t n;
    do {
        n = ::read(static_cast<int>(file.Get()), destination, count);
    } while (n < 0 && errno == EINTR);
    if (n < 0) return false;
    done = static_cast<uint32_t>(n);
    return true;
}

bool NativeHandle::Write(const void* source, uint32_t count, uint32_t& done) {
    done = 0;
    if (!IsOpen()) return false;
    const char* bytes = static_cast<const char*>(source);
    while (done < count) {
        const ssize_t n = ::write(static_cast<int>(file.Get()), bytes + done, count - done);
        if (n < 0) {
            if (errno == EINTR) continue;
            return false;
        }
        done += static_cast<uint32_t>(n);
    }
    return true;
}

bool NativeHandle::Flush() { return IsOpen() && fsync(static_cast<int>(file.Get())) == 0; }
