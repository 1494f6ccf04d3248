#pragma once

#include <cstdint>
#include <string>

#include "base/unique_handle.h"

// The thin OS layer under FileStream: one open file, closed on destruction.
// Each operation returns false on failure; FileStream turns that into its
// own error texts.
class NativeHandle {
public:
    enum class Mode {
        CreateAlways,  // write, exclusive, truncate or create
        OpenRead,      // read, shared for reading, must exist
        OpenAlways,    // write, exclusive, open or create, no truncation
    };

    bool Open(const std::string& path, Mode mode);
    void Close() { file.Reset(); }
    bool IsOpen() const { return file.IsValid(); }

    bool Seek(int64_t offset, uint32_t origin, int64_t& newPosition);
    bool Length(int64_t& length);
    bool Read(void* destination, uint32_t count, uint32_t& done);
    bool Write(const void* source, uint32_t count, uint32_t& done);
    bool Flush();

private:
    // A Win32 HANDLE or a POSIX descriptor; -1 (INVALID_HANDLE_VALUE on
    // Windows) for none.
    struct Traits {
        using Value = intptr_t;
        static Value Invalid() { return -1; }
        static void Close(Value value);
    };
    UniqueHandle<Traits> file;
};
