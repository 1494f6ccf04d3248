#include <cstdlib>
#include <vector>

#include "base/exception.h"

#include "base/paths.h"
#include "base/unique_handle_posix.h"

const char kPathSeparator = '/';

std::string GetTempDirectory() {
    const char* tmp = std::getenv("TMPDIR");
    std::string folder = (tmp != nullptr && *tmp != '\0') ? tmp : "/tmp";
    if (folder.back() != '/') folder += '/';
    return folder;
}

std::string MakeTempFileName(const std::string& prefix) {
    std::string pattern = GetTempDirectory() + prefix + "XXXXXX";
    std::vector<char> name(pattern.begin(), pattern.end());
    name.push_back('\0');
    // The file only reserves the name.
    if (!UniqueFileDescriptor(::mkstemp(name.data()))) throw Exception("GetTempFileName failed");
    return name.data();
}

// The desktop's documents folder when it is set, else ~/Documents.
std::string GetDocumentsFolder() {
    const char* documents = std::getenv("XDG_DOCUMENTS_DIR");
    if (documents != nullptr && *documents != '\0') return documents;
    const char* home = std::getenv("HOME");
    if (home == nullptr || *home == '\0') return "";
    return PathJoin(home, "Documents");
}
