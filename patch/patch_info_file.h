#pragma once

#include <tinyxml.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "base/registry_hive.h"

// An archive as the description's "Archives" list declares it.
struct DeclaredArchive {
    int64_t size = 0;
    std::string sha256;  // 64 lower-case hexadecimal digits
};

// The patch description ("patchinfo.xml"): which files a patch rebuilds
// from deltas, adds or deletes, which directories, registry keys and
// groups it adds or removes, where the game's registry key lives and how
// much space the patch needs. The lists are handed out item by item
// through nine cursors. The same schema, with "new" items only, is the
// uninstall record, written by Save.
class PatchInfoFile {
public:
    PatchInfoFile() = default;
    PatchInfoFile(const PatchInfoFile&) = delete;
    PatchInfoFile& operator=(const PatchInfoFile&) = delete;
    virtual ~PatchInfoFile() = default;

    // Parses the file and reads the hive, registry path and space
    // requirement, and the elements older readers skip: the versions the
    // patch starts from and leads to and the archives' sizes and SHA-256.
    // Throws "Failed to load patch info file." when it cannot be read,
    // "Hive not recognized" for an unknown hive name, and CorruptData for an
    // archive list that is not well formed. The cursors are left at their
    // ends until ResetIterators.
    void Load(const std::string& path);
    // Load from the text of a description (the very bytes that were
    // checked), with the same outcomes.
    void Parse(std::string text);
    // Puts every cursor on the first item of its list.
    void ResetIterators();
    // Items of FileChanges plus items of DirectoryChanges, of every kind.
    int32_t CountFileAndDirectoryChanges() const;

    // Each fills its outputs from the current item and moves on; false
    // once the list is exhausted. A missing attribute reads as empty.
    bool NextDiffFile(std::string& path, std::string& archive);
    bool NextNewFile(std::string& path, std::string& archive);
    bool NextDeletedFile(std::string& path);
    bool NextDeletedDirectory(std::string& path);
    bool NextNewDirectory(std::string& path);
    bool NextDeletedRegistryKey(std::string& path);
    bool NextNewRegistryKey(std::string& path);
    bool NextDeletedRegistryGroup(std::string& path);
    bool NextNewRegistryGroup(std::string& path);

    RegistryHive GetHive() const { return hive; }
    std::string GetRegistryPath() const { return registryPath; }
    // Bytes the patch needs; -1 when the description does not say.
    int64_t GetSpaceRequirement() const { return spaceRequirement; }
    // The version the patch leads to; empty when the description does not say.
    const std::string& GetVersion() const { return version; }
    // The installed version the patch was made for; empty when the
    // description does not say (as a complete build never does).
    const std::string& GetFromVersion() const { return fromVersion; }
    // The declared archives by file name; empty without an "Archives" list.
    const std::map<std::string, DeclaredArchive>& GetDeclaredArchives() const { return declaredArchives; }

    // Writes a description holding one "new" item per entry of each list,
    // then the hive and registry path. Throws "Hive not supported" for a
    // hive outside the three; a failed write is logged and returns false,
    // leaving any earlier file intact.
    [[nodiscard]] static bool Save(const std::string& path, const std::vector<std::string>& files,
                                   const std::vector<std::string>& directories,
                                   const std::vector<std::string>& registryKeys,
                                   const std::vector<std::string>& registryGroups, RegistryHive hive,
                                   const std::string& registryPath);

    // "HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER", "HKEY_USERS", exactly.
    static RegistryHive ParseHive(const std::string& text);
    static std::string HiveName(RegistryHive hive);

private:
    enum Cursor {
        kDiffFile,
        kNewFile,
        kDeletedFile,
        kDeletedDirectory,
        kNewDirectory,
        kDeletedRegistryKey,
        kNewRegistryKey,
        kDeletedRegistryGroup,
        kNewRegistryGroup,
        kCursorCount,
    };

    bool Next(Cursor cursor, std::string& path, std::string* archive);
    void ReadDeclaredArchives();

    TiXmlDocument document;
    const TiXmlElement* root = nullptr;
    const TiXmlElement* cursors[kCursorCount] = {};
    RegistryHive hive = RegistryHive::LocalMachine;
    std::string registryPath;
    int64_t spaceRequirement = -1;
    std::string version;
    std::string fromVersion;
    std::map<std::string, DeclaredArchive> declaredArchives;
};
