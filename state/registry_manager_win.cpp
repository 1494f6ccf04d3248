#include <windows.h>

#include <vector>

#include "base/unique_handle_win.h"
#include "state/registry_manager.h"

namespace {

HKEY RootKey(RegistryHive hive) {
    switch (hive) {
        case RegistryHive::LocalMachine:
            return HKEY_LOCAL_MACHINE;
        case RegistryHive::CurrentUser:
            return HKEY_CURRENT_USER;
        case RegistryHive::Users:
            return HKEY_USERS;
        case RegistryHive::None:
            break;
    }
    return nullptr;
}

// The game's installer and the earlier updaters were 32-bit programs: on a
// 64-bit Windows their HKEY_LOCAL_MACHINE\SOFTWARE keys live in the 32-bit
// view, which a 64-bit process sees only when it asks for it (the flag
// changes nothing on a 32-bit Windows).
constexpr REGSAM kView = KEY_WOW64_32KEY;

}  // namespace

namespace RegistryPlatform {

bool QueryValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName, std::string& data) {
    const HKEY root = RootKey(hive);
    if (root == nullptr) return false;
    // A key only the system's own view has (a 64-bit-only system such as a
    // Wine prefix without 32-bit support keeps DirectX's key there alone)
    // is still read.
    UniqueRegistryKey opened;
    if (RegOpenKeyExA(root, keyPath.c_str(), 0, KEY_READ | kView, opened.Receive()) != ERROR_SUCCESS &&
        RegOpenKeyExA(root, keyPath.c_str(), 0, KEY_READ, opened.Receive()) != ERROR_SUCCESS) {
        return false;
    }
    DWORD size = 0;
    if (RegQueryValueExA(opened.Get(), valueName.c_str(), nullptr, nullptr, nullptr, &size) != ERROR_SUCCESS ||
        size == 0) {
        return false;
    }
    std::vector<BYTE> buffer(size);
    if (RegQueryValueExA(opened.Get(), valueName.c_str(), nullptr, nullptr, buffer.data(), &size) != ERROR_SUCCESS) {
        return false;
    }
    data.assign(reinterpret_cast<const char*>(buffer.data()), size);
    return size != 0;
}

bool CreateKey(RegistryHive hive, const std::string& keyPath) {
    const HKEY root = RootKey(hive);
    if (root == nullptr) return false;
    UniqueRegistryKey created;
    DWORD disposition = 0;
    const LONG result = RegCreateKeyExA(root, keyPath.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE, KEY_WRITE | kView,
                                        nullptr, created.Receive(), &disposition);
    return result == ERROR_SUCCESS && (disposition == REG_CREATED_NEW_KEY || disposition == REG_OPENED_EXISTING_KEY);
}

bool SetStringValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName,
                    const std::string& text) {
    const HKEY root = RootKey(hive);
    if (root == nullptr) return false;
    UniqueRegistryKey opened;
    if (RegOpenKeyExA(root, keyPath.c_str(), 0, KEY_WRITE | kView, opened.Receive()) != ERROR_SUCCESS) return false;
    const DWORD size = static_cast<DWORD>(text.size() + 1);
    return RegSetValueExA(opened.Get(), valueName.c_str(), 0, REG_SZ, reinterpret_cast<const BYTE*>(text.c_str()),
                          size) == ERROR_SUCCESS;
}

}  // namespace RegistryPlatform
