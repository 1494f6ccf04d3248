#pragma once

#include <string>

#include "patch/patch_stages.h"

class InstallationData;

// Whom the uninstall record is kept for.
struct UninstallOwner {
    std::string registryKeyPath;
    std::string productGuid;
    bool machineWide = false;
    std::string sid;  // the player's, when this process is their elevated copy
};

// The records an installation keeps about itself besides the progress
// record, written only here: the installation data (its version), the
// uninstall record and the update history. PatchStages::Apply calls them
// in its one order.
class InstallationRecords final : public IInstallationRecords {
public:
    // data must be loaded from the installation folder; it is borrowed.
    InstallationRecords(InstallationData& data, const UninstallOwner& owner) : installation(data), uninstall(owner) {}

    void StoreVersion(const std::string& version) override;
    // Merges what the batch added into the uninstall record and appends
    // the batch's line to the history. The record lists what every patch
    // added; a missing one starts afresh and an unreadable one is kept
    // aside, so a finished update is never reported as failed because of
    // it.
    void RecordInstalledBatch(const PatchBatch& batch, PatchInfoFile& description) override;

private:
    InstallationData& installation;
    const UninstallOwner uninstall;
};
