#pragma once

#include <cstddef>
#include <cstdint>

// The program's resources as compiled into the POSIX build; the table is
// generated at build time from the same files the Windows .rc names.
struct EmbeddedResource {
    const char* name;
    const char* type;
    const uint8_t* data;
    size_t size;
};

extern const EmbeddedResource kEmbeddedResources[];
extern const size_t kEmbeddedResourceCount;
