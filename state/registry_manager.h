#pragma once

#include <string>

#include "base/registry_hive.h"

// Finds and keeps the registry key where the game records its installation
// folder and the player's language. Reads report failure by false or an
// empty text; only writes throw.
class RegistryManager {
public:
    RegistryManager() = default;
    RegistryManager(RegistryHive root, const std::string& path);
    virtual ~RegistryManager() = default;

    // Looks for the key holding an installation folder under the local
    // machine, then the current user, then (with a SID) that user's hive
    // under HKEY_USERS. False, with no hive and no key, when none has one.
    bool Locate(const std::string& keyPath, const std::string& userSid);

    // The text of a value (its type is not checked), up to its first zero.
    bool ReadString(const std::string& valueName, std::string& value) const;
    // Creates the key when missing and stores value as REG_SZ. Throws
    // Exception (RegistryFailed) when the key or the value cannot be written.
    void WriteString(const std::string& valueName, const std::string& value) const;

    // "Install Dir" without surrounding blanks; empty when unreadable.
    std::string GetInstallDir() const;
    // "Language" as stored.
    std::string GetLanguage() const;
    bool HasInstallDir() const;
    void SetInstallDir(const std::string& value) const;
    void SetLanguage(const std::string& value) const;

    RegistryHive GetHive() const { return hive; }
    const std::string& GetKeyPath() const { return keyPath; }

private:
    RegistryHive hive = RegistryHive::None;
    std::string keyPath;
};

// The platform's registry, narrowed to what the manager needs. Key paths
// are backslash-separated, value names and key names ignore case.
namespace RegistryPlatform {
// The value's raw data. False when the key cannot be opened for reading or
// the value is missing or empty.
[[nodiscard]] bool QueryValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName,
                              std::string& data);
// Creates the key with its missing parents; true when it exists afterwards.
[[nodiscard]] bool CreateKey(RegistryHive hive, const std::string& keyPath);
// Stores text plus its terminating zero as REG_SZ in an existing key.
[[nodiscard]] bool SetStringValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName,
                                  const std::string& text);
}  // namespace RegistryPlatform
