#include <windows.h>

#include <shlwapi.h>

#include "base/file_operations.h"

bool FileExists(const std::string& path) { return PathFileExistsA(path.c_str()) == TRUE; }

bool RemoveFile(const std::string& path) { return DeleteFileA(path.c_str()) != FALSE; }

bool RenameFile(const std::string& from, const std::string& to) { return MoveFileA(from.c_str(), to.c_str()) != FALSE; }

bool MoveFileReplacing(const std::string& from, const std::string& to) {
    return MoveFileExA(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH) != FALSE;
}

void SyncFolder(const std::string&) {}

void CollectFiles(const std::string& folder, std::vector<std::string>& list) {
    WIN32_FIND_DATAA entry;
    HANDLE search = FindFirstFileA((folder + "\\*").c_str(), &entry);
    if (search == INVALID_HANDLE_VALUE) return;
    std::vector<std::string> subfolders;
    do {
        const std::string name = entry.cFileName;
        if (name == "." || name == "..") continue;
        const std::string path = folder + "\\" + name;
        if (entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) {
            subfolders.push_back(path);
        } else {
            list.push_back(path);
        }
    } while (FindNextFileA(search, &entry));
    FindClose(search);
    for (const std::string& subfolder : subfolders) CollectFiles(subfolder, list);
}
