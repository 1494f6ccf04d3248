#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "base/registry_hive.h"

// Everything a patch description ("patchinfo.xml") of a patch or complete
// build says, in the order the file lists it. Paths are relative, with
// backslashes.
struct PatchDescription {
    std::vector<std::pair<std::string, std::string>> diffFiles;  // path, archive
    std::vector<std::pair<std::string, std::string>> newFiles;   // path, archive
    std::vector<std::string> deletedFiles;
    std::vector<std::string> deletedDirectories;
    std::vector<std::string> newDirectories;
    RegistryHive hive = RegistryHive::LocalMachine;
    std::string registryPath;
    int64_t spaceRequirement = -1;  // -1: not written
};

// Writes the description as the updater's own XML files are printed.
// Throws Exception when the file cannot be written.
void WritePatchDescription(const PatchDescription& description, const std::string& path);
