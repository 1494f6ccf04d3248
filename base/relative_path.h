#pragma once

#include <string>

// True when a path taken from a patch description stays inside the folder
// it is joined to: not empty, not rooted ("\x", "C:x", "\\host"), and
// without a ".." component (either slash separates).
bool IsContainedRelativePath(const std::string& path);
