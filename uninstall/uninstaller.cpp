#include "uninstall/uninstaller.h"

#include <algorithm>

#include "base/file_operations.h"
#include "base/item_path.h"
#include "base/log.h"
#include "base/paths.h"
#include "patch/patch_info_file.h"

namespace {

// Registry key paths are backslash-separated on every platform.
constexpr char kRegistrySeparator = '\\';

// Removes what the description deletes from the list, then appends what it
// adds and the list does not hold yet.
template <typename List, typename NextDeleted, typename NextAdded, typename Qualify>
void MergeGroup(List& list, NextDeleted nextDeleted, NextAdded nextAdded, const Qualify& qualify) {
    std::string name;
    std::string full;
    while (nextDeleted(name)) {
        if (qualify(name, full)) list.Remove(full);
    }
    while (nextAdded(name)) {
        if (qualify(name, full)) list.Add(full);
    }
}

}  // namespace

void Uninstaller::List::Remove(const std::string& item) {
    if (present.erase(item) == 0) return;
    items.erase(std::find(items.begin(), items.end(), item));
}

Uninstaller::Uninstaller(const std::string& path) : recordPath(path) { AddChanges(recordPath, false); }

Uninstaller::Uninstaller(const std::string& installDir, const std::string& registryKeyPath, const std::string& path,
                         const std::string& guid, bool isMachineWide, const std::string& userSid, bool loadExisting)
    : installDirectory(installDir), recordPath(path), productGuid(guid), machineWide(isMachineWide), sid(userSid) {
    if (loadExisting) {
        AddChanges(recordPath, false);
        return;
    }
    if (!sid.empty() && !machineWide) {
        hive = RegistryHive::Users;
        registryPath = PathJoin(sid, registryKeyPath, kRegistrySeparator);
    } else {
        hive = machineWide ? RegistryHive::LocalMachine : RegistryHive::CurrentUser;
        registryPath = registryKeyPath;
    }
}

void Uninstaller::AddRecordFile() { files.Add(recordPath); }

void Uninstaller::AddFile(const std::string& path) { files.Add(path); }

void Uninstaller::AddChanges(const std::string& patchInfoPath, bool qualify) {
    PatchInfoFile description;
    description.Load(patchInfoPath);
    AddChanges(description, qualify);
}

void Uninstaller::AddChanges(PatchInfoFile& description, bool qualify) {
    if (hive == RegistryHive::None) hive = description.GetHive();
    if (registryPath.empty()) registryPath = description.GetRegistryPath();
    description.ResetIterators();

    // A name that climbs out of the installation must never reach a list
    // that the uninstall deletes from.
    const auto inFolder = [&](const std::string& name, std::string& full) {
        if (!qualify) {
            full = name;
            return true;
        }
        if (!IsSafeItemPath(name)) {
            LOG(Error) << "Not recording an unsafe path: " << name;
            return false;
        }
        full = PathJoin(installDirectory, name);
        return true;
    };
    const auto inRegistry = [&](const std::string& name, std::string& full) {
        full = qualify ? PathJoin(registryPath, name, kRegistrySeparator) : name;
        return true;
    };
    PatchInfoFile& d = description;
    std::string archive;
    MergeGroup(
        files, [&](std::string& n) { return d.NextDeletedFile(n); },
        [&](std::string& n) { return d.NextNewFile(n, archive); }, inFolder);
    MergeGroup(
        directories, [&](std::string& n) { return d.NextDeletedDirectory(n); },
        [&](std::string& n) { return d.NextNewDirectory(n); }, inFolder);
    MergeGroup(
        registryKeys, [&](std::string& n) { return d.NextDeletedRegistryKey(n); },
        [&](std::string& n) { return d.NextNewRegistryKey(n); }, inRegistry);
    MergeGroup(
        registryGroups, [&](std::string& n) { return d.NextDeletedRegistryGroup(n); },
        [&](std::string& n) { return d.NextNewRegistryGroup(n); }, inRegistry);
}

bool Uninstaller::Save() const {
    return PatchInfoFile::Save(recordPath, files.Items(), directories.Items(), registryKeys.Items(),
                               registryGroups.Items(), hive, registryPath);
}

void Uninstaller::Remove(const std::string& installDir) {
    // The record is a file on disk anyone may edit: a name that leaves the
    // installation, names the folder itself or could match more than one
    // thing is skipped, never deleted.
    const auto inside = [&installDir](const std::string& path) {
        if (IsSafeItemPath(PathBelow(path, installDir))) return true;
        LOG(Error) << "Not removing a path outside the installation: " << path;
        return false;
    };
    for (const std::string& file : files.Items()) {
        if (!inside(file)) continue;
        if (!RemoveFile(file)) {
            LOG(Trace) << "Could not delete file: " << file;
            undeletableFiles.push_back(file);
        }
    }
    std::vector<std::string> ordered = directories.Items();
    std::stable_sort(ordered.begin(), ordered.end(),
                     [](const std::string& a, const std::string& b) { return a.size() > b.size(); });
    for (const std::string& directory : ordered) {
        if (!inside(directory)) continue;
        if (!DeleteDirectory(directory, false)) {
            LOG(Trace) << "Could not remove directory: " << directory;
            unremovableDirectories.push_back(directory);
        }
    }
}
