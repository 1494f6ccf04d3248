#include <windows.h>

#include <vector>

#include "base/path_kind.h"
#include "base/paths.h"

PathKind KindOf(const std::string& path) {
    const DWORD attributes = GetFileAttributesA(path.c_str());
    if (attributes == INVALID_FILE_ATTRIBUTES) return PathKind::Missing;
    if (attributes & FILE_ATTRIBUTE_REPARSE_POINT) return PathKind::Link;
    return (attributes & FILE_ATTRIBUTE_DIRECTORY) ? PathKind::Directory : PathKind::File;
}

int64_t FileSizeOf(const std::string& path) {
    WIN32_FILE_ATTRIBUTE_DATA data;
    if (GetFileAttributesExA(path.c_str(), GetFileExInfoStandard, &data) == FALSE) return -1;
    if (data.dwFileAttributes & (FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_REPARSE_POINT)) return -1;
    return static_cast<int64_t>((static_cast<uint64_t>(data.nFileSizeHigh) << 32) | data.nFileSizeLow);
}

std::string LongPathName(const std::string& path) {
    // The longest part that exists is resolved; the rest cannot have an
    // alias yet.
    std::string head = path;
    std::string tail;
    while (!head.empty() && GetFileAttributesA(head.c_str()) == INVALID_FILE_ATTRIBUTES) {
        const std::string parent = GetParentDirectory(head);
        if (parent == head) break;
        tail = tail.empty() ? GetFileName(head) : PathJoin(GetFileName(head), tail);
        head = parent;
    }
    if (head.empty()) return path;
    const DWORD size = GetLongPathNameA(head.c_str(), nullptr, 0);
    if (size == 0) return path;
    std::vector<char> full(size);
    const DWORD written = GetLongPathNameA(head.c_str(), full.data(), size);
    if (written == 0 || written >= size) return path;
    const std::string resolved(full.data(), written);
    return tail.empty() ? resolved : PathJoin(resolved, tail);
}

void ClearReadOnly(const std::string& path) {
    const DWORD attributes = GetFileAttributesA(path.c_str());
    if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_READONLY)) {
        SetFileAttributesA(path.c_str(), attributes & ~static_cast<DWORD>(FILE_ATTRIBUTE_READONLY));
    }
}
