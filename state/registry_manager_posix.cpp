// The registry as a folder tree: one folder per hive under the store's
// root, one sub-folder per key, and the values of a key in one small text
// file that is replaced atomically on every write.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <system_error>
#include <vector>

#include "base/atomic_file.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "base/string_helpers.h"
#include "state/registry_manager.h"

namespace {

// Folder names that start with a dot never stand for a key (see
// FolderNameFor), so the store's own files cannot meet a key's folder.
const char* const kValuesFile = ".values";
const char* const kValuesTemporary = ".values.tmp";
// The limits Windows puts on names, so that what fails there fails here.
constexpr size_t kMaximumKeyNameLength = 255;
constexpr size_t kMaximumValueNameLength = 16383;

struct StoredValue {
    std::string name;
    std::string text;
};

std::string StoreRoot() {
    const char* root = std::getenv("IRONVALE_REGISTRY_ROOT");
    if (root != nullptr && *root != '\0') return root;
    std::string config;
    const char* xdg = std::getenv("XDG_CONFIG_HOME");
    if (xdg != nullptr && *xdg != '\0') {
        config = xdg;
    } else {
        const char* home = std::getenv("HOME");
        if (home == nullptr || *home == '\0') return std::string();
        config = PathJoin(home, ".config");
    }
    return PathJoin(PathJoin(config, "ironvale"), "registry");
}

char HexDigit(unsigned value) { return "0123456789ABCDEF"[value & 0xF]; }

int HexValue(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return -1;
}

// A key name may hold any character but the backslash; a folder name may
// not hold '/' and must not be "." or "..". Those characters, '%', control
// characters and a leading dot are written as %XX.
std::string FolderNameFor(const std::string& keyName) {
    std::string folder;
    for (size_t i = 0; i < keyName.size(); ++i) {
        const unsigned char c = static_cast<unsigned char>(keyName[i]);
        if (c == '/' || c == '%' || c < 0x20 || c == 0x7F || (c == '.' && i == 0)) {
            folder += '%';
            folder += HexDigit(c >> 4);
            folder += HexDigit(c);
        } else {
            folder += static_cast<char>(c);
        }
    }
    return folder;
}

bool IsDirectory(const std::string& path) {
    std::error_code error;
    return std::filesystem::is_directory(path, error);
}

// The sub-folder of parent for a key name. Registry names ignore case, so
// a folder whose name differs only in case is the same key.
bool FindChild(const std::string& parent, const std::string& folderName, std::string& child) {
    const std::string exact = PathJoin(parent, folderName);
    if (IsDirectory(exact)) {
        child = exact;
        return true;
    }
    std::error_code error;
    for (std::filesystem::directory_iterator it(parent, error), end; !error && it != end; it.increment(error)) {
        if (EqualsIgnoringCase(it->path().filename().string(), folderName) && IsDirectory(it->path().string())) {
            child = it->path().string();
            return true;
        }
    }
    return false;
}

// The folder of hive\keyPath; with create, missing keys are made.
bool KeyFolder(RegistryHive hive, const std::string& keyPath, bool create, std::string& folder) {
    const std::string root = StoreRoot();
    const std::string hiveName = RegistryHiveName(hive);
    if (root.empty() || hiveName.empty()) return false;
    folder = PathJoin(root, hiveName);
    if (create && !MakeDirectories(folder)) return false;
    if (!IsDirectory(folder)) return false;
    std::istringstream parts(keyPath);
    std::string name;
    while (std::getline(parts, name, '\\')) {
        if (name.empty()) continue;
        if (name.size() > kMaximumKeyNameLength) return false;
        const std::string folderName = FolderNameFor(name);
        std::string child;
        if (!FindChild(folder, folderName, child)) {
            if (!create) return false;
            child = PathJoin(folder, folderName);
            std::error_code error;
            std::filesystem::create_directory(child, error);
            if (!IsDirectory(child)) return false;
        }
        folder = child;
    }
    return true;
}

// Each line is a value: its name, a TAB, its text. Backslashes and control
// characters (TAB and line ends included) are escaped as \\ and \xXX, so a
// hand-edited file stays readable and every byte survives.
std::string Escape(const std::string& text) {
    std::string out;
    for (const char ch : text) {
        const unsigned char c = static_cast<unsigned char>(ch);
        if (c == '\\') {
            out += "\\\\";
        } else if (c < 0x20 || c == 0x7F) {
            out += "\\x";
            out += HexDigit(c >> 4);
            out += HexDigit(c);
        } else {
            out += ch;
        }
    }
    return out;
}

std::string Unescape(const std::string& text) {
    std::string out;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 1 < text.size() && text[i + 1] == '\\') {
            out += '\\';
            ++i;
        } else if (text[i] == '\\' && i + 3 < text.size() && text[i + 1] == 'x' && HexValue(text[i + 2]) >= 0 &&
                   HexValue(text[i + 3]) >= 0) {
            out += static_cast<char>(HexValue(text[i + 2]) * 16 + HexValue(text[i + 3]));
            i += 3;
        } else {
            out += text[i];
        }
    }
    return out;
}

// False when a values file exists but cannot be read: writing over it
// would lose the values it holds.
bool ReadValues(const std::string& folder, std::vector<StoredValue>& values) {
    const std::string path = PathJoin(folder, kValuesFile);
    std::error_code error;
    const std::filesystem::file_status status = std::filesystem::status(path, error);
    if (status.type() == std::filesystem::file_type::not_found) return true;
    if (status.type() != std::filesystem::file_type::regular) return false;
    std::ifstream file(path, std::ios::binary);
    if (!file) return false;
    std::string line;
    while (std::getline(file, line)) {
        const size_t tab = line.find('\t');
        if (tab == std::string::npos) continue;
        values.push_back({Unescape(line.substr(0, tab)), Unescape(line.substr(tab + 1))});
    }
    return !file.bad();
}

}  // namespace

namespace RegistryPlatform {

bool QueryValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName, std::string& data) {
    std::string folder;
    std::vector<StoredValue> values;
    if (!KeyFolder(hive, keyPath, false, folder) || !ReadValues(folder, values)) return false;
    for (const StoredValue& value : values) {
        if (EqualsIgnoringCase(value.name, valueName)) {
            // As Windows hands out a REG_SZ: the text and its terminator.
            data = value.text + '\0';
            return true;
        }
    }
    return false;
}

bool CreateKey(RegistryHive hive, const std::string& keyPath) {
    std::string folder;
    return KeyFolder(hive, keyPath, true, folder);
}

bool SetStringValue(RegistryHive hive, const std::string& keyPath, const std::string& valueName,
                    const std::string& text) {
    std::string folder;
    std::vector<StoredValue> values;
    if (valueName.size() > kMaximumValueNameLength) return false;
    if (!KeyFolder(hive, keyPath, false, folder) || !ReadValues(folder, values)) return false;
    bool replaced = false;
    for (StoredValue& value : values) {
        if (EqualsIgnoringCase(value.name, valueName)) {
            value.text = text;
            replaced = true;
            break;
        }
    }
    if (!replaced) values.push_back({valueName, text});
    std::string content;
    for (const StoredValue& value : values) content += Escape(value.name) + '\t' + Escape(value.text) + '\n';
    return ReplaceFileAtomically(PathJoin(folder, kValuesFile), content, PathJoin(folder, kValuesTemporary));
}

}  // namespace RegistryPlatform
