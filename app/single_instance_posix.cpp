#include "app/single_instance.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include "base/paths.h"

const char* const kInstanceName = "IronvaleUpdater";

void SingleInstance::Traits::Close(intptr_t value) { ::close(static_cast<int>(value)); }

bool SingleInstance::Acquire() {
    const std::string path = PathJoin(GetTempDirectory(), std::string(kInstanceName) + ".lock");
    const int fd = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
    if (fd < 0) return false;
    guard.Reset(fd);
    return flock(fd, LOCK_EX | LOCK_NB) == 0;
}
