#include <windows.h>

#include <shlobj.h>
#include <shlwapi.h>

#include "base/file_journal.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "base/unique_handle_win.h"

bool FileExists(const std::string& path) { return PathFileExistsA(path.c_str()) == TRUE; }

bool RemoveFile(const std::string& path) {
    if (DeleteFileA(path.c_str()) == FALSE) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->RemovedFile(path);
    return true;
}

bool RenameFile(const std::string& from, const std::string& to) {
    if (MoveFileA(from.c_str(), to.c_str()) == FALSE) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->Moved(from, to);
    return true;
}

bool MoveFileReplacing(const std::string& from, const std::string& to) {
    if (MoveFileExA(from.c_str(), to.c_str(),
                    MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH | MOVEFILE_COPY_ALLOWED) == FALSE) {
        return false;
    }
    // Written through: the move is on the disk when the call returns.
    if (IFileJournal* journal = GetFileJournal()) {
        journal->Moved(from, to);
        journal->SyncedFolder(GetParentDirectory(from));
        journal->SyncedFolder(GetParentDirectory(to));
    }
    return true;
}

// Moves are written through, and NTFS journals the rest of a folder's
// entries itself.
void SyncFolder(const std::string&) {}

namespace {

// Removes what is at path with everything below it, but never what a link
// (a junction, a symbolic link, any reparse point) leads to: the link
// itself goes. The shell's delete follows them, and would empty a folder
// outside the installation that a link inside it names.
bool RemoveTree(const std::string& path) {
    const DWORD attributes = GetFileAttributesA(path.c_str());
    if (attributes == INVALID_FILE_ATTRIBUTES) return false;
    if (attributes & FILE_ATTRIBUTE_READONLY) {
        SetFileAttributesA(path.c_str(), attributes & ~static_cast<DWORD>(FILE_ATTRIBUTE_READONLY));
    }
    if ((attributes & FILE_ATTRIBUTE_DIRECTORY) == 0) return DeleteFileA(path.c_str()) != FALSE;
    if ((attributes & FILE_ATTRIBUTE_REPARSE_POINT) == 0) {
        WIN32_FIND_DATAA entry;
        HANDLE search = FindFirstFileA((path + "\\*").c_str(), &entry);
        if (search != INVALID_HANDLE_VALUE) {
            do {
                const std::string name = entry.cFileName;
                if (name != "." && name != "..") RemoveTree(path + "\\" + name);
            } while (FindNextFileA(search, &entry));
            FindClose(search);
        }
    }
    return RemoveDirectoryA(path.c_str()) != FALSE;
}

}  // namespace

bool DeleteDirectory(const std::string& path, bool recursive) {
    if (path.empty()) return false;
    const bool removed = recursive ? RemoveTree(path) : RemoveDirectoryA(path.c_str()) != FALSE;
    if (IFileJournal* journal = GetFileJournal(); journal != nullptr && removed) journal->RemovedDirectory(path);
    return removed;
}

bool MakeDirectories(const std::string& path) {
    const int result = SHCreateDirectoryExA(nullptr, path.c_str(), nullptr);
    if (result != ERROR_SUCCESS && result != ERROR_ALREADY_EXISTS && result != ERROR_FILE_EXISTS) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->MadeDirectories(path);
    return true;
}

void CollectFiles(const std::string& folder, std::vector<std::string>& list) {
    WIN32_FIND_DATAA entry;
    UniqueFindHandle search(FindFirstFileA((folder + "\\*").c_str(), &entry));
    if (!search) return;
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
    } while (FindNextFileA(search.Get(), &entry));
    search.Reset();
    for (const std::string& subfolder : subfolders) CollectFiles(subfolder, list);
}

bool GetFreeDiskSpace(const std::string& folder, int64_t& bytes) {
    ULARGE_INTEGER available;
    if (GetDiskFreeSpaceExA(folder.c_str(), &available, nullptr, nullptr) == FALSE) return false;
    bytes = static_cast<int64_t>(available.QuadPart);
    return true;
}

std::vector<std::string> ListFileNames(const std::string& folder) {
    std::vector<std::string> names;
    WIN32_FIND_DATAA entry;
    const UniqueFindHandle search(FindFirstFileA((folder + "\\*").c_str(), &entry));
    if (!search) return names;
    do {
        if ((entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) == 0) names.push_back(entry.cFileName);
    } while (FindNextFileA(search.Get(), &entry));
    return names;
}
