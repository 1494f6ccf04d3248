#pragma once

// The POSIX handle kinds, each with what closes it. Only POSIX code includes
// this header.

#include <dirent.h>
#include <unistd.h>

#include "base/unique_handle.h"

struct FileDescriptorTraits {
    using Value = int;
    static Value Invalid() { return -1; }
    static void Close(Value value) { ::close(value); }
};
using UniqueFileDescriptor = UniqueHandle<FileDescriptorTraits>;

// A folder listing from opendir.
struct DirectoryStreamTraits {
    using Value = DIR*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { ::closedir(value); }
};
using UniqueDirectoryStream = UniqueHandle<DirectoryStreamTraits>;
