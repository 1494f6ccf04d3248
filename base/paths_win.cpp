#include <windows.h>

#include <vector>

#include "base/exception.h"
#include "base/paths.h"

const char kPathSeparator = '\\';

std::string GetTempDirectory() {
    const DWORD needed = GetTempPathA(0, nullptr);
    if (needed == 0) throw Exception("GetTempPath failed");
    std::vector<char> buffer(needed + 1, '\0');
    const DWORD length = GetTempPathA(static_cast<DWORD>(buffer.size()), buffer.data());
    if (length == 0) throw Exception("GetTempPath failed");
    return std::string(buffer.data(), length);
}
