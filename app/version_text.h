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
