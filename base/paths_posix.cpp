#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <system_error>

#include "base/paths.h"

const char kPathSeparator = '/';

std::string GetTempDirectory() {
    const char* tmp = std::getenv("TMPDIR");
    std::string folder = (tmp != nullptr && *tmp != '\0') ? tmp : "/tmp";
    if (folder.back() != '/') folder += '/';
    return folder;
}

bool DeleteDirectory(const std::string& path, bool recursive) {
    if (path.empty()) return false;
    if (!recursive) return ::rmdir(path.c_str()) == 0;
    std::error_code error;
    std::filesystem::remove_all(path, error);
    return !error;
}

bool MakeDirectories(const std::string& path) {
    std::error_code error;
    std::filesystem::create_directories(path, error);
    return std::filesystem::is_directory(path, error);
}
