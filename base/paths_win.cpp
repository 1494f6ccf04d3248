#include <windows.h>

#include <shellapi.h>
#include <shlobj.h>

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

bool DeleteDirectory(const std::string& path, bool recursive) {
    if (path.empty()) return false;
    if (!recursive) return RemoveDirectoryA(path.c_str()) != FALSE;
    std::string from = path;
    from.push_back('\0');  // the list ends with two NULs
    SHFILEOPSTRUCTA operation = {};
    operation.hwnd = nullptr;
    operation.wFunc = FO_DELETE;
    operation.pFrom = from.c_str();
    operation.pTo = nullptr;
    operation.fFlags = FOF_SILENT | FOF_NOCONFIRMATION | FOF_NOERRORUI;
    return SHFileOperationA(&operation) == 0;
}

bool MakeDirectories(const std::string& path) {
    const int result = SHCreateDirectoryExA(nullptr, path.c_str(), nullptr);
    return result == ERROR_SUCCESS || result == ERROR_ALREADY_EXISTS || result == ERROR_FILE_EXISTS;
}
