#pragma once

#include <string>

// The separator of file paths: a backslash on Windows, a slash on POSIX.
// Paths in patch descriptions use backslashes; joining converts them.
extern const char kPathSeparator;

// The one rule for joining: slashes of the other kind become the separator,
// trailing separators of both parts and leading ones of the tail are
// dropped, and exactly one separator is written between them.
std::string PathJoin(const std::string& base, const std::string& tail, char separator = kPathSeparator);

// Text before the last separator (either slash counts, and the result
// uses kPathSeparator); empty when there is none.
std::string GetParentDirectory(const std::string& path);
// Text after the last separator; the whole path when there is none.
std::string GetFileName(const std::string& path);

// The part of path below folder (platform separators, no leading one), or
// empty when path does not lie below folder. Compares exactly.
std::string PathBelow(const std::string& path, const std::string& folder);

// The user's temporary folder, with its trailing separator.
std::string GetTempDirectory();
// Creates a new, empty file with a unique name in the temporary folder
// (the name begins with prefix) and returns its path. Throws
// "GetTempFileName failed" when none can be made.
std::string MakeTempFileName(const std::string& prefix);
// The user's documents folder; empty when the system cannot tell.
std::string GetDocumentsFolder();
