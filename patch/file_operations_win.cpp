#include <windows.h>
#include <shlwapi.h>

#include "patch/file_operations.h"

bool FileExists(const std::string& path) { return PathFileExistsA(path.c_str()) == TRUE; }

bool RemoveFile(const std::string& path) { return DeleteFileA(path.c_str()) != FALSE; }

bool RenameFile(const std::string& from, const std::string& to) { return MoveFileA(from.c_str(), to.c_str()) != FALSE; }
