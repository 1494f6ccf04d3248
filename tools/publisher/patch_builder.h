#pragma once

#include <cstdint>
#include <ostream>
#include <string>

#include "base/registry_hive.h"

struct P256PrivateKey;

// What the publisher asks for: a patch from one game tree to the next, or
// (with no old tree) the complete build of a tree.
struct BuildOptions {
    std::string fromDir;  // empty: a complete build of toDir
    std::string toDir;
    std::string version;
    std::string outDir;
    // Archives are closed before they would grow past this; a single
    // member larger than it gets an archive of its own.
    int64_t maxArchiveSize = 64 * 1024 * 1024;
    RegistryHive hive = RegistryHive::LocalMachine;
    std::string registryPath = "SOFTWARE\\Halvard\\Ironvale";
    std::string xdelta3 = "xdelta3";
    std::ostream* progress = nullptr;  // one line per file when set
    // Signs the description ("patchinfo.xml.sig") when set; not owned.
    const P256PrivateKey* signingKey = nullptr;
    // The version of the old tree, recorded in a patch's description: an
    // updater with a key takes a patch only for the version it starts from,
    // so a signed patch must name it.
    std::string fromVersion{};
};

// The folder names the updater asks for.
std::string PatchFolderName(const std::string& version);
std::string BuildFolderName(const std::string& version);

// Writes outDir/patch_515195_V (or outDir/build_V for a complete build)
// with its patchinfo.xml and archives, replacing an earlier folder of that
// name only once the new one is complete. Returns the folder's path.
// Throws Exception on every failure, leaving no partial folder behind.
std::string BuildPatch(const BuildOptions& options);

// Throws Exception unless version can name a folder and be read back as
// the first word of version.txt.
void CheckVersionText(const std::string& version);
// Throws unless the updater orders version at or after the one site's
// "version.txt" names (when there is one): a player must never be offered
// a version that counts as older than theirs.
void CheckVersionFollows(const std::string& site, const std::string& version);
