#include <windows.h>

#include "base/log_file.h"
#include "base/unique_handle_win.h"

namespace {
UniqueFileHandle file;
}  // namespace

namespace LogFile {

bool IsOpen() { return file.IsValid(); }

bool Open(const std::string& path, bool truncate) {
    file.Reset(CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, truncate ? CREATE_ALWAYS : OPEN_ALWAYS,
                           FILE_ATTRIBUTE_NORMAL, nullptr));
    if (!file) return false;
    SetFilePointer(file.Get(), 0, nullptr, FILE_END);
    return true;
}

void Close() { file.Reset(); }

bool Size(int64_t& size) {
    LARGE_INTEGER value;
    if (!GetFileSizeEx(file.Get(), &value)) return false;
    size = value.QuadPart;
    return true;
}

void Append(const std::string& bytes) {
    // Every line goes to the end, also when another thread wrote just
    // before: move there, then write the whole line in one call.
    SetFilePointer(file.Get(), 0, nullptr, FILE_END);
    DWORD written = 0;
    WriteFile(file.Get(), bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr);
}

}  // namespace LogFile
