#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "base/registry_hive.h"

// One archive of a patch as the description declares it, so the updater
// can tell a damaged or substituted download from the real one.
struct ArchiveRecord {
    std::string file;
    int64_t size = 0;
    std::string sha256;  // lower-case hexadecimal
};

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
    // Elements the updater's older readers skip: the version the patch
    // leads to (a signed description cannot be replayed for another), the
    // one it starts from (nor taken for a patch of another installation)
    // and the archives.
    std::string version;      // empty: not written
    std::string fromVersion;  // empty: not written
    std::vector<ArchiveRecord> archives;
};

// Writes the description as the updater's own XML files are printed.
// Throws Exception when the file cannot be written.
void WritePatchDescription(const PatchDescription& description, const std::string& path);
