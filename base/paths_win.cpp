#include <windows.h>

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

std::string MakeTempFileName(const std::string& prefix) {
    const std::string folder = GetTempDirectory();
    char name[MAX_PATH + 1] = {};
    if (GetTempFileNameA(folder.c_str(), prefix.c_str(), 0, name) == 0) throw Exception("GetTempFileName failed");
    return name;
}

std::string GetDocumentsFolder() {
    char folder[MAX_PATH] = {};
    if (SHGetFolderPathA(nullptr, CSIDL_PERSONAL, nullptr, SHGFP_TYPE_CURRENT, folder) != S_OK) return "";
    return folder;
}
