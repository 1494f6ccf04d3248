// The two stages of one patch or build, as the run drives them: the space
// check, the downloads and the preparation, then the installation changed
// behind its progress record, the uninstall record and the clean-up.
#include <memory>

#include "app/temporary_files.h"
#include "app/updater.h"
#include "app/version_text.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "text/localization.h"
#include "uninstall/uninstaller.h"

void Updater::StageOne(bool installed) {
    const std::wstring space = Localize("INSTALLER_ERROR_NOT_ENOUGH_SPACE") + L"\n%d " +
                               Localize("INSTALLER_REQUIRED_SPACE") + L"\n" +
                               Localize("INSTALLER_ERROR_FREE_UP_SPACE") + L"\n";
    if (!CheckDiskSpace(installDir, space, false)) {
        throw Exception("Space check failed in stage one. Exiting.", ErrorCode::UserCancelled);
    }
    installationData.SetPatcherVersion(kUpdaterVersion);
    if (installed) installationData.Save();

    const std::list<DownloadEntry> list = BuildDownloadList();
    totalFiles = static_cast<int32_t>(list.size());
    doneFiles = 0;
    if (!list.empty()) {
        downloader.SetStatusView(this);
        downloader.Start(list, true);
    } else {
        gui.SetOverallProgress(1000);
    }
    stages->Prepare(CurrentBatch(), &downloader, this);
}

void Updater::StageTwo(bool installed) {
    stages->Apply(CurrentBatch(), this, [this](const std::string& version) {
        installationData.currentVersion = version;
        return installationData.Save();
    });
    WriteUninstallRecord(installed);
    RemoveFile(patchInfoPath);
    CleanTemporaryFiles(patchDir, patchedDir);
}

bool Updater::CheckDiskSpace(const std::string& folder, const std::wstring& message, bool quiet) {
    int64_t available = 0;
    if (!GetFreeDiskSpace(folder, available)) {
        LOG_AS("Updater", Error) << "GetDiskFreeSpaceEx call failed.";
        return true;
    }
    const int64_t required = patchInfo.GetSpaceRequirement();
    if (required <= 0 || required < available) return true;
    if (!quiet && !message.empty()) {
        std::wstring text = message;
        text.replace(text.find(L"%d"), 2, std::to_wstring(required / 1000000));
        gui.ShowError(text);
    }
    return false;
}

// Each archive the description declares must arrive as declared.
std::list<DownloadEntry> Updater::BuildDownloadList() {
    const std::vector<std::string> names = ArchivesInFetchOrder(patchInfo);
    std::list<DownloadEntry> list = MakeDownloadList(names, patchUrl, patchDir);
    auto name = names.begin();
    for (DownloadEntry& entry : list) {
        const auto declared = patchInfo.GetDeclaredArchives().find(*name++);
        if (declared == patchInfo.GetDeclaredArchives().end()) continue;
        entry.declaredSize = declared->second.size;
        entry.declaredSha256 = declared->second.sha256;
    }
    return list;
}

PatchBatch Updater::CurrentBatch() const {
    return PatchBatch{installDir, patchDir,      patchedDir,
                      patchUrl,   latestVersion, {kInstallationDataFileName, kUninstallRecordName}};
}

// The record lists what every patch added; a missing one starts afresh
// and an unreadable one is kept aside, so a finished update is never
// reported as failed because of it.
void Updater::WriteUninstallRecord(bool installed) {
    const std::string recordPath = PathJoin(installDir, kUninstallRecordName);
    const std::string sid = arguments.internallyElevated ? arguments.sid : "";
    const bool machineWide = registry.GetHive() == RegistryHive::LocalMachine;
    bool loadExisting = installed;
    if (loadExisting && !FileExists(recordPath)) {
        LOG_AS("Updater", Info) << "No uninstall record yet, starting " << recordPath;
        loadExisting = false;
    }
    std::unique_ptr<Uninstaller> record;
    try {
        record = std::make_unique<Uninstaller>(installDir, registryKeyPath, recordPath, productGuid, machineWide, sid,
                                               loadExisting);
    } catch (const Exception& error) {
        LOG_AS("Updater", Error) << "Unreadable uninstall record (" << error.message << "), kept as " << recordPath
                                 << ".bad";
        MoveFileReplacing(recordPath, recordPath + ".bad");
        record = std::make_unique<Uninstaller>(installDir, registryKeyPath, recordPath, productGuid, machineWide, sid,
                                               false);
    }
    record->AddChanges(patchInfoPath, true);
    record->AddFile(PathJoin(installDir, "UpdateHistory.log"));
    record->Save();
}
