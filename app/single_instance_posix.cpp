#include "app/single_instance.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include "base/own_file_posix.h"
#include "base/paths.h"

const char* const kInstanceName = "IronvaleUpdater";

void SingleInstance::Traits::Close(intptr_t value) { ::close(static_cast<int>(value)); }

bool SingleInstance::Acquire() {
    const std::string path = PathJoin(GetTempDirectory(), std::string(kInstanceName) + ".lock");
    UniqueFileDescriptor file = OpenOwnFile(path, O_RDWR);
    if (!file) return false;
    const int fd = file.Get();
    guard.Reset(file.Release());
    return flock(fd, LOCK_EX | LOCK_NB) == 0;
}
