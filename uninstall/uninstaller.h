#pragma once

#include <string>
#include <unordered_set>
#include <vector>

#include "base/registry_hive.h"

class PatchInfoFile;

// The uninstall record ("Uninstall.xml"): everything the installer and the
// patches put into the installation and no later patch took away - files,
// directories, registry keys and groups - plus the hive and key of the
// game's settings. Written in the patch description's schema.

class Uninstaller {
public:
    // Reading form: the record at recordPath, names as stored. Throws
    // "Failed to load patch info file." when it cannot be read.
    explicit Uninstaller(const std::string& recordPath);
    // Recording form. With loadExisting the record at recordPath is merged
    // first and gives the hive and registry path; otherwise they follow
    // from the installation's kind: another user's SID (from an elevated
    // copy) selects HKEY_USERS\SID\key, else HKEY_LOCAL_MACHINE for a
    // machine-wide and HKEY_CURRENT_USER for a per-user installation.
    Uninstaller(const std::string& installDir, const std::string& registryKeyPath, const std::string& recordPath,
                const std::string& productGuid, bool machineWide, const std::string& sid, bool loadExisting);
    Uninstaller(const Uninstaller&) = delete;
    Uninstaller& operator=(const Uninstaller&) = delete;
    virtual ~Uninstaller() = default;

    // Lists the record itself, so the uninstall removes it too.
    void AddRecordFile();
    // Merges a patch description: its deleted items leave the lists, then
    // its new items join them (diff items change nothing). With qualify,
    // file and directory names are joined to the installation folder and
    // registry names to the registry path; names that would leave the
    // installation folder are not recorded.
    void AddChanges(const std::string& patchInfoPath, bool qualify);
    void AddChanges(PatchInfoFile& description, bool qualify);
    // Lists one full path unless it is already listed.
    void AddFile(const std::string& path);
    // Writes the record. Throws "Hive not supported" while the hive is not
    // known; a failed write is logged and returns false.
    [[nodiscard]] bool Save() const;
    // Deletes the listed files, then removes the listed directories that
    // are empty by then, deepest first. Only what lies inside installDir is
    // touched; what cannot go is remembered and skipped. Registry entries
    // are left alone.
    void Remove(const std::string& installDir);

    const std::vector<std::string>& GetFiles() const { return files.Items(); }
    const std::vector<std::string>& GetDirectories() const { return directories.Items(); }
    const std::vector<std::string>& GetRegistryKeys() const { return registryKeys.Items(); }
    const std::vector<std::string>& GetRegistryGroups() const { return registryGroups.Items(); }
    const std::vector<std::string>& GetUndeletableFiles() const { return undeletableFiles; }
    const std::vector<std::string>& GetUnremovableDirectories() const { return unremovableDirectories; }
    RegistryHive GetHive() const { return hive; }
    std::string GetRegistryPath() const { return registryPath; }
    std::string GetProductGuid() const { return productGuid; }
    std::string GetSid() const { return sid; }

private:
    // An ordered list without duplicates. Membership is hashed so that
    // merging a complete build of tens of thousands of files stays fast.
    class List {
    public:
        void Add(const std::string& item) {
            if (present.insert(item).second) items.push_back(item);
        }
        void Remove(const std::string& item);
        const std::vector<std::string>& Items() const { return items; }

    private:
        std::vector<std::string> items;
        std::unordered_set<std::string> present;
    };

    List files;
    List directories;
    List registryKeys;
    List registryGroups;
    std::vector<std::string> undeletableFiles;
    std::vector<std::string> unremovableDirectories;
    std::string installDirectory;
    std::string registryPath;
    std::string recordPath;
    std::string productGuid;
    bool machineWide = false;
    std::string sid;
    RegistryHive hive = RegistryHive::None;
};
