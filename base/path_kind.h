#pragma once

#include <cstdint>
#include <string>

// What is at a path on the disk, the path itself never followed: a
// symbolic link, a junction or any other reparse point is a Link, whatever
// it points to.
enum class PathKind { Missing, File, Directory, Link };
PathKind KindOf(const std::string& path);
// The size of the file at path, without opening it; -1 when path is not a
// file (missing, a folder or a link).
int64_t FileSizeOf(const std::string& path);

// The first link met on the way from root down to root joined with
// relative (either slash separates), the last component only when
// includeLast is set; empty when there is none. root itself is not looked
// at: an installation may well live behind a link, but nothing below it
// may lead elsewhere.
std::string FirstLinkBelow(const std::string& root, const std::string& relative, bool includeLast);

// path with every existing component spelled as the file system names it
// in full. On Windows an 8.3 alias becomes the long name (TEMP~MPE is
// tempPatch), so two spellings of one file compare equal; elsewhere path
// as it is.
std::string LongPathName(const std::string& path);

// Clears the read-only attribute of a file the patch replaces or deletes
// (the game's files are the patch's to change). Nothing to do on POSIX,
// where a file's own mode never stops its folder's owner.
void ClearReadOnly(const std::string& path);
