#include <windows.h>

#include <shellapi.h>
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
    if (MoveFileExA(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH) == FALSE) {
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

bool DeleteDirectory(const std::string& path, bool recursive) {
    if (path.empty()) return false;
    bool removed;
    if (!recursive) {
        removed = RemoveDirectoryA(path.c_str()) != FALSE;
    } else {
        std::string from = path;
        from.push_back('\0');  // the list ends with two NULs
        SHFILEOPSTRUCTA operation = {};
        operation.hwnd = nullptr;
        operation.wFunc = FO_DELETE;
        operation.pFrom = from.c_str();
        operation.pTo = nullptr;
        operation.fFlags = FOF_SILENT | FOF_NOCONFIRMATION | FOF_NOERRORUI;
        removed = SHFileOperationA(&operation) == 0;
    }
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
