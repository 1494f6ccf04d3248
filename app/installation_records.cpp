#include "app/installation_records.h"

#include <memory>

#include "app/update_history.h"
#include "app/version_text.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "state/installation_data.h"
#include "uninstall/uninstaller.h"

void InstallationRecords::StoreVersion(const std::string& version) {
    installation.currentVersion = version;
    installation.SetPatcherVersion(kUpdaterVersion);
    if (!installation.Save()) {
        throw Exception("Failed to store the installed version " + version, ErrorCode::StepFailed);
    }
}

void InstallationRecords::RecordInstalledBatch(const PatchBatch& batch, PatchInfoFile& description) {
    const std::string& folder = batch.installationFolder;
    const std::string recordPath = PathJoin(folder, kUninstallRecordName);
    const auto newRecord = [&](bool loadExisting) {
        return std::make_unique<Uninstaller>(folder, uninstall.registryKeyPath, recordPath, uninstall.productGuid,
                                             uninstall.machineWide, uninstall.sid, loadExisting);
    };
    std::unique_ptr<Uninstaller> record;
    if (!FileExists(recordPath)) {
        LOG_AS("Updater", Info) << "No uninstall record yet, starting " << recordPath;
        record = newRecord(false);
    } else {
        try {
            record = newRecord(true);
        } catch (const Exception& error) {
            LOG_AS("Updater", Error) << "Unreadable uninstall record (" << error.message << "), kept as " << recordPath
                                     << ".bad";
            if (!MoveFileReplacing(recordPath, recordPath + ".bad")) {
                LOG_AS("Updater", Error) << "The unreadable uninstall record could not be kept aside.";
            }
            record = newRecord(false);
        }
    }
    record->AddChanges(description, true);
    record->AddFile(PathJoin(folder, "UpdateHistory.log"));
    // A courtesy to the game's uninstaller: the batch is never undone for
    // it, and Save logs what went wrong.
    static_cast<void>(record->Save());
    AppendUpdateHistory(folder, batch.location);
}
