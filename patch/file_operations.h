#pragma once

#include <string>

// Single-file operations on the installation's records. Each reports
// failure by returning false; none throws.

// True when a file or folder exists at path.
bool FileExists(const std::string& path);
// Deletes one file (not a folder).
bool RemoveFile(const std::string& path);
// Renames a file; fails when something already exists at the new path.
bool RenameFile(const std::string& from, const std::string& to);
