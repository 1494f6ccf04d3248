#pragma once

#include <cstdint>
#include <filesystem>
#include <map>
#include <set>
#include <string>

// Everything below a game folder, as a patch description names it:
// relative paths with backslashes, in byte order, so that two walks of the
// same tree always produce the same patch.
struct TreeListing {
    std::map<std::string, uint64_t> files;  // path -> size in bytes
    std::set<std::string> directories;
};

// Walks root. Throws Exception when root or anything below it cannot be
// listed, when an entry is neither a file nor a folder, and when a name
// cannot be carried by a patch (see CheckEntryName).
TreeListing ListTree(const std::string& root);

// The narrow name of one folder entry, in the form patch descriptions and
// archives carry it: on Windows in the system code page, on POSIX as UTF-8.
// Throws Exception naming the folder when the name cannot be represented.
std::string NarrowEntryName(const std::filesystem::path& name, const std::string& folder);

// A path of the updater's narrow form as the file system library takes it.
std::filesystem::path ToFileSystemPath(const std::string& path);

// True when both files hold the same bytes. Throws Exception when either
// cannot be read.
bool SameFileContent(const std::string& first, const std::string& second);
