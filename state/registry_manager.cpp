#include "state/registry_manager.h"

#include "base/exception.h"
#include "base/paths.h"

namespace {

const char* const kInstallDirValue = "Install Dir";
const char* const kLanguageValue = "Language";

std::string TrimBlanks(const std::string& text) {
    const char* const blanks = " \t\n\r";
    const size_t first = text.find_first_not_of(blanks);
    if (first == std::string::npos) return std::string();
    const size_t last = text.find_last_not_of(blanks);
    return text.substr(first, last - first + 1);
}

}  // namespace

RegistryManager::RegistryManager(RegistryHive root, const std::string& path) : hive(root), keyPath(path) {}

bool RegistryManager::Locate(const std::string& path, const std::string& userSid) {
    keyPath = path;
    hive = RegistryHive::LocalMachine;
    if (HasInstallDir()) return true;
    hive = RegistryHive::CurrentUser;
    if (HasInstallDir()) return true;
    if (!userSid.empty()) {
        // An elevated copy runs as another account; the starting user's
        // values live in that user's hive.
        hive = RegistryHive::Users;
        keyPath = PathJoin(userSid, path, '\\');
        if (HasInstallDir()) return true;
    }
    hive = RegistryHive::None;
    keyPath.clear();
    return false;
}

bool RegistryManager::ReadString(const std::string& valueName, std::string& value) const {
    std::string data;
    if (!RegistryPlatform::QueryValue(hive, keyPath, valueName, data) || data.empty()) return false;
    value = data.substr(0, data.find('\0'));
    return true;
}

void RegistryManager::WriteString(const std::string& valueName, const std::string& value) const {
    if (!RegistryPlatform::CreateKey(hive, keyPath)) {
        throw Exception("Failed to create registry key: " + keyPath, ErrorCode::RegistryFailed);
    }
    if (!RegistryPlatform::SetStringValue(hive, keyPath, valueName, value)) {
        throw Exception("Failed to write registry value: " + valueName, ErrorCode::RegistryFailed);
    }
}

std::string RegistryManager::GetInstallDir() const {
    std::string value;
    ReadString(kInstallDirValue, value);
    return TrimBlanks(value);
}

std::string RegistryManager::GetLanguage() const {
    std::string value;
    ReadString(kLanguageValue, value);
    return value;
}

bool RegistryManager::HasInstallDir() const { return !GetInstallDir().empty(); }

void RegistryManager::SetInstallDir(const std::string& value) const { WriteString(kInstallDirValue, value); }

void RegistryManager::SetLanguage(const std::string& value) const { WriteString(kLanguageValue, value); }
