#include "state/configuration.h"

#include "net/location.h"

void Configuration::Clear() {
    latestVersionUrl.clear();
    patchUrl.clear();
    completeInstallUrl.clear();
    patchInstallPath.clear();
    patchedFilesPath.clear();
    patchInfoFilename.clear();
    productGuid.clear();
    registryKey.clear();
    displayName.clear();
    requiredDirectXVersion.clear();
    gameExecutable.clear();
    gameParameters.clear();
    supportedOsNames.clear();
}

void Configuration::SetDefaults(const std::string& updateLocation) {
    latestVersionUrl = updateLocation.empty() ? "version.txt" : JoinLocation(updateLocation, "version.txt");
    patchUrl = updateLocation;
    completeInstallUrl = updateLocation;
    patchInstallPath = "tempPatch";
    patchedFilesPath = "patched";
    patchInfoFilename = "patchinfo.xml";
    productGuid = "{5D21B7E0-94C3-4f0a-8B6E-2A7C19F04E53}";
    registryKey = "SOFTWARE\\Halvard\\Ironvale";
    displayName = "Ironvale";
    requiredDirectXVersion = "9";
    gameExecutable = "IronvaleGame.exe";
    gameParameters = "";
    supportedOsNames = {"XP", "Vista", "Server2003", "Windows7"};
}
