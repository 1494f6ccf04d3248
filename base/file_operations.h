#pragma once

#include <cstdint>
#include <string>
#include <vector>

// Single-file operations on the installation's records. Each reports
// failure by returning false; none throws.

// True when a file or folder exists at path.
bool FileExists(const std::string& path);
// Deletes one file (not a folder).
[[nodiscard]] bool RemoveFile(const std::string& path);
// Renames a file; fails when something already exists at the new path.
[[nodiscard]] bool RenameFile(const std::string& from, const std::string& to);
// Moves a file over whatever is at the new path. On Windows the move is
// written through to the disk before it returns; on POSIX call SyncFolder
// on the destination folder to make it durable.
[[nodiscard]] bool MoveFileReplacing(const std::string& from, const std::string& to);
// Makes the entries of a folder (renames, new files) durable. Nothing to do
// on Windows, where moves are written through.
void SyncFolder(const std::string& folder);
// Removes a folder: only an empty one, or with everything in it. A link
// (a symbolic link, a junction) is removed itself and never entered, at
// path or anywhere below it.
[[nodiscard]] bool DeleteDirectory(const std::string& path, bool recursive);
// Creates a folder with every missing parent; true when it exists afterwards.
[[nodiscard]] bool MakeDirectories(const std::string& path);
// The bytes the calling user may still write on the volume of folder;
// false when the system cannot tell.
[[nodiscard]] bool GetFreeDiskSpace(const std::string& folder, int64_t& bytes);
// The names of the files (not folders) directly in folder; empty when it
// cannot be listed.
std::vector<std::string> ListFileNames(const std::string& folder);
// Appends the full path of every file below folder: the folder's own files
// first, then everything below each subfolder, in the order the file system
// lists them. A folder that cannot be listed adds nothing.
void CollectFiles(const std::string& folder, std::vector<std::string>& list);

// For what only takes room (a temporary file, a leftover of an earlier
// run): removed when possible. A failure leaves it for a later clean-up,
// and nothing depends on it being gone.
inline void DiscardFile(const std::string& path) { static_cast<void>(RemoveFile(path)); }
inline void DiscardDirectory(const std::string& path) { static_cast<void>(DeleteDirectory(path, true)); }
