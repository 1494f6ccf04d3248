#pragma once

#include <string>
#include <vector>

// Every built-in setting: where to fetch, where to put things, how the game
// is known on the machine. Set once by SetDefaults, then only read.
class Configuration {
public:
    Configuration() { Clear(); }
    virtual ~Configuration() = default;

    void Clear();
    // The built-in values. updateLocation, when not empty, is where the
    // publisher serves the latest-version file, the patches and the builds
    // (an http:// address, say); empty, they are found by their names
    // beside the program.
    void SetDefaults(const std::string& updateLocation = "");

    std::string GetLatestVersionUrl() const { return latestVersionUrl; }
    std::string GetPatchUrl() const { return patchUrl; }
    std::string GetCompleteInstallUrl() const { return completeInstallUrl; }
    std::string GetPatchInstallPath() const { return patchInstallPath; }
    std::string GetPatchedFilesPath() const { return patchedFilesPath; }
    std::string GetPatchInfoFilename() const { return patchInfoFilename; }
    std::string GetProductGuid() const { return productGuid; }
    std::string GetRegistryKey() const { return registryKey; }
    std::string GetDisplayName() const { return displayName; }
    std::string GetRequiredDirectXVersion() const { return requiredDirectXVersion; }
    std::string GetGameExecutable() const { return gameExecutable; }
    std::string GetGameParameters() const { return gameParameters; }
    std::vector<std::string> GetSupportedOsNames() const { return supportedOsNames; }

private:
    std::string latestVersionUrl;
    std::string patchUrl;
    std::string completeInstallUrl;
    std::string patchInstallPath;
    std::string patchedFilesPath;
    std::string patchInfoFilename;
    std::string productGuid;
    std::string registryKey;
    std::string displayName;
    std::string requiredDirectXVersion;
    std::string gameExecutable;
    std::string gameParameters;
    std::vector<std::string> supportedOsNames;
};
