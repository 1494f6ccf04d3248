#pragma once

#include <string>

// This updater's own version, recorded in the installations it serves; an
// installation recorded by another version must be reinstalled.
constexpr float kUpdaterVersion = 3.0f;

// Every patch is made against this fixed base; the installed version plays
// no part in the folder name.
extern const char* const kPatchBaseVersion;

// "patch_" + base + "_" + latest, and "build_" + latest: the folders the
// server keeps a patch and a complete build in.
std::string PatchName(const std::string& baseVersion, const std::string& latestVersion);
std::string BuildName(const std::string& latestVersion);

// The first word of the latest-version file: a UTF-8 byte-order mark, then
// blanks, tabs and line breaks before it are skipped, and it ends at the
// next one. Empty when the text holds no word.
std::string FirstWord(const std::string& text);

// Whether the installed version is older than the latest. Versions are
// opaque text compared byte-wise, except when both are whole decimal
// numbers (what patch and build names use): those compare as numbers, so
// 9 is older than 10 and 1000 is not older than 999.
bool IsOlderVersion(const std::string& installed, const std::string& latest);
