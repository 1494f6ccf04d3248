#pragma once

#include <cstddef>
#include <cstdint>

// A resource of the program's own module. Windows: a real resource of the
// .exe; POSIX: the same bytes compiled into the program at build time.
struct ResourceBytes {
    const uint8_t* data = nullptr;
    size_t size = 0;
};

// False when the resource is missing, cannot be loaded, or is empty.
bool FindProgramResource(const char* name, const char* type, ResourceBytes& bytes);
