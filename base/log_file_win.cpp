#include <windows.h>

#include "base/log_file.h"

namespace {
HANDLE file = nullptr;
}  // namespace

namespace LogFile {

bool IsOpen() { return file != nullptr && file != INVALID_HANDLE_VALUE; }

bool Open(const std::string& path, bool truncate) {
    file = CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, truncate ? CREATE_ALWAYS : OPEN_ALWAYS,
                       FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        file = nullptr;
        return false;
    }
    SetFilePointer(file, 0, nullptr, FILE_END);
    return true;
}

void Close() {
    if (IsOpen()) CloseHandle(file);
    file = nullptr;
}

bool Size(int64_t& size) {
    LARGE_INTEGER value;
    if (!GetFileSizeEx(file, &value)) return false;
    size = value.QuadPart;
    return true;
}

void Append(const std::string& bytes) {
    // Every line goes to the end, also when another thread wrote just
    // before: move there, then write the whole line in one call.
    SetFilePointer(file, 0, nullptr, FILE_END);
    DWORD written = 0;
    WriteFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr);
}

}  // namespace LogFile
