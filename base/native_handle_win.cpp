#include "base/native_handle.h"

#include <windows.h>

namespace {
HANDLE AsHandle(intptr_t value) { return reinterpret_cast<HANDLE>(value); }
}  // namespace

void NativeHandle::Traits::Close(intptr_t value) { CloseHandle(AsHandle(value)); }

bool NativeHandle::Open(const std::string& path, Mode mode) {
    Close();
    HANDLE h = INVALID_HANDLE_VALUE;
    switch (mode) {
        case Mode::CreateAlways:
            h = CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
            break;
        case Mode::OpenRead:
            h = CreateFileA(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                            FILE_FLAG_RANDOM_ACCESS, nullptr);
            break;
        case Mode::OpenAlways:
            h = CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, OPEN_ALWAYS, 0, nullptr);
            break;
    }
    file.Reset(reinterpret_cast<intptr_t>(h));
    return IsOpen();
}

bool NativeHandle::Seek(int64_t offset, uint32_t origin, int64_t& newPosition) {
    LARGE_INTEGER distance;
    distance.QuadPart = offset;
    LARGE_INTEGER result;
    result.QuadPart = 0;
    if (!SetFilePointerEx(AsHandle(file.Get()), distance, &result, origin)) return false;
    newPosition = result.QuadPart;
    return true;
}

bool NativeHandle::Length(int64_t& length) {
    LARGE_INTEGER size;
    if (!GetFileSizeEx(AsHandle(file.Get()), &size)) return false;
    length = size.QuadPart;
    return true;
}

bool NativeHandle::Read(void* destination, uint32_t count, uint32_t& done) {
    DWORD read = 0;
    const BOOL ok = ReadFile(AsHandle(file.Get()), destination, count, &read, nullptr);
    done = read;
    return ok != FALSE;
}

bool NativeHandle::Write(const void* source, uint32_t count, uint32_t& done) {
    DWORD written = 0;
    const BOOL ok = WriteFile(AsHandle(file.Get()), source, count, &written, nullptr);
    done = written;
    return ok != FALSE;
}

bool NativeHandle::Flush() { return FlushFileBuffers(AsHandle(file.Get())) != FALSE; }
