#include <windows.h>

#include <shlwapi.h>
#include <wininet.h>

#include "net/location.h"

std::string GetUrlHostName(const std::string& url) {
    char host[256] = {};
    URL_COMPONENTSA parts = {};
    parts.dwStructSize = sizeof(parts);
    parts.lpszHostName = host;
    parts.dwHostNameLength = sizeof(host);
    if (!InternetCrackUrlA(url.c_str(), 0, 0, &parts)) return std::string();
    return std::string(host, parts.dwHostNameLength);
}

std::string GetProgramFolder() {
    char path[MAX_PATH + 1] = {};
    const DWORD length = GetModuleFileNameA(nullptr, path, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) return std::string();
    const std::string full(path, length);
    const size_t last = full.find_last_of('\\');
    return last == std::string::npos ? std::string() : full.substr(0, last + 1);
}

bool IsUncLocation(const std::string& location) { return location.compare(0, 2, "\\\\") == 0; }

bool IsRelativeLocation(const std::string& location) { return PathIsRelativeA(location.c_str()) != FALSE; }
