#pragma once

#include <map>
#include <string>

// The record an installation keeps about itself ("InstallationData.xml" in
// its folder): the installed game version ("-1" while a patch is being
// applied), the version of the updater that wrote it, the licence versions
// the user accepted, an edition label and a map of file digests. The flow
// reads and assigns the members directly.

class InstallationData {
public:
    InstallationData() = default;
    virtual ~InstallationData() = default;

    // Stores the folder and the record's path in it.
    void SetDirectory(const std::string& folder);
    // SetDirectory, then reads the record. Throws "Failed to load
    // InstallationData file." when it cannot be parsed and "Failed to read
    // InstallationData file." when a required value is missing.
    void Load(const std::string& folder);
    // Replaces the record atomically. A failure is logged at Error level
    // and returns false; the old record then stays as it was.
    [[nodiscard]] bool Save() const;
    // Stores the number as a default-formatted stream writes it (3 -> "3").
    void SetPatcherVersion(float number);

    std::string currentVersion;
    std::string patcherVersion;
    std::string eulaVersion;
    std::string pbEulaVersion;
    std::string directory;
    std::string filePath;
    std::string sku;
    // File name -> digest, written back as "key,value," pairs in key order.
    std::map<std::string, std::string> installedHashes;
};
