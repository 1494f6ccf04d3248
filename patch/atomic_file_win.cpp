#include <windows.h>

#include <string>

bool MoveReplacingDurably(const std::string& from, const std::string& to) {
    return MoveFileExA(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH) != FALSE;
}

void RemoveFileQuietly(const std::string& path) { DeleteFileA(path.c_str()); }
