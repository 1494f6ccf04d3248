#pragma once

// Only POSIX code includes this header.

#include <string>

#include "base/unique_handle_posix.h"

// Opens the file at a fixed name in a folder other users may write (the
// shared temporary folder) for reading and writing, creating it when it is
// missing. Never through a link, and never a file someone else made: either
// could point our writes at another user's file. Invalid when refused.
UniqueFileDescriptor OpenOwnFile(const std::string& path, int flags);
