// One batch's two stages as the run drives them: the work folders and the
// description, the space check, the downloads and the preparation, then
// the installation changed behind its progress record and the clean-up.
#include "app/installation_records.h"
#include "app/temporary_files.h"
#include "app/updater.h"
#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "net/kept_download.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "text/localization.h"

void Updater::InstallBatch(const PatchBatch& batch, const CheckedDescription& checked, PatchInfoFile& description) {
    LOG_AS("Updater", Info) << "Patch URL:" << batch.location;
    try {
        if (!MakeDirectories(batch.patchFolder) || !MakeDirectories(batch.patchedFilesFolder)) {
            throw Exception("Failed to create the work folder " + batch.patchedFilesFolder, ErrorCode::StepFailed);
        }
        // The checked bytes, durable before stage two's first record: a
        // resume reads them back and checks them again.
        const std::string path = PathJoin(batch.patchFolder, configuration.GetPatchInfoFilename());
        if (!ReplaceFileAtomically(path, checked.text) ||
            (!checked.signature.empty() && !ReplaceFileAtomically(path + ".sig", checked.signature))) {
            throw Exception("Failed to write the patch description " + path, ErrorCode::StepFailed);
        }
        PatchStages stages(batch, description, progressFile, Services());
        StageOne(stages, batch, description);
        // A cancel confirmed while stage one finished must not let stage
        // two begin.
        quitRequested.ThrowIfCancelled("User cancelled before the installation was changed.");
        StageTwo(stages, batch, std::nullopt);
    } catch (const Exception& error) {
        AbandonBatch(batch, error);
        throw;
    }
}

void Updater::ResumeBatch(const PatchBatch& batch, const ResumePoint& resumeAt, const CheckedDescription& checked) {
    LOG_AS("Updater", Info) << "Patch URL:" << batch.location;
    PatchInfoFile description;
    description.Parse(checked.text);
    PatchStages stages(batch, description, progressFile, Services());
    try {
        StageTwo(stages, batch, resumeAt);
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::PreparedFilesMissing) {
            // Nothing has been moved yet: prepared again, the batch goes on
            // from its record.
            LOG_AS("Updater", Error) << error.message << " Preparing the patch again.";
            StageOne(stages, batch, description);
            quitRequested.ThrowIfCancelled("User cancelled before the installation was changed further.");
            StageTwo(stages, batch, resumeAt);
        } else if (error.Code() == ErrorCode::ReinstallRequired) {
            // Moves have run and files are lost: the record goes, and the
            // next pass finds the installation in change without one, which
            // the complete build finishes.
            LOG_AS("Updater", Error) << error.message << " Installing the complete build.";
            DiscardFile(progressFile.GetAlternativeRecordPath());
            if (!RemoveFile(progressFile.GetRecordPath())) {
                throw Exception("Failed to remove the progress record " + progressFile.GetRecordPath(),
                                ErrorCode::StepFailed);
            }
        } else {
            throw;
        }
    }
}

void Updater::AbandonBatch(const PatchBatch& batch, const Exception& failure) {
    downloader.RequestStop();
    downloader.WaitForWorker();
    // An archive that did not arrive (the line, the server) is the one
    // failure the next start may get past with what arrived so far.
    const bool keepDownloads = failure.Code() == ErrorCode::FileNotFound;
    if (installationData.currentVersion != "-1") {
        CleanTemporaryFiles(batch.patchFolder, batch.patchedFilesFolder, keepDownloads);
    }
}

StageServices Updater::Services() { return StageServices{this, &retryBox, &quitRequested}; }

void Updater::StageOne(PatchStages& stages, const PatchBatch& batch, PatchInfoFile& description) {
    const std::wstring space = Localize("INSTALLER_ERROR_NOT_ENOUGH_SPACE") + L"\n%d " +
                               Localize("INSTALLER_REQUIRED_SPACE") + L"\n" +
                               Localize("INSTALLER_ERROR_FREE_UP_SPACE") + L"\n";
    if (!CheckDiskSpace(batch.installationFolder, description.GetSpaceRequirement(), space, false)) {
        throw Exception("Space check failed in stage one. Exiting.", ErrorCode::UserCancelled);
    }
    const std::list<DownloadEntry> list = BuildDownloadList(batch, description);
    totalFiles = static_cast<int32_t>(list.size());
    doneFiles = 0;
    if (!list.empty()) {
        downloader.SetStatusView(this);
        downloader.Start(list, true);
    } else {
        gui.SetOverallProgress(1000);
    }
    stages.Prepare(downloader);
}

void Updater::StageTwo(PatchStages& stages, const PatchBatch& batch, const std::optional<ResumePoint>& resumeAt) {
    const bool machineWide = registry.GetHive() == RegistryHive::LocalMachine;
    InstallationRecords records(installationData, UninstallOwner{registryKeyPath, productGuid, machineWide,
                                                                 arguments.internallyElevated ? arguments.sid : ""});
    stages.Apply(&records, resumeAt);
    CleanTemporaryFiles(batch.patchFolder, batch.patchedFilesFolder);
}

bool Updater::CheckDiskSpace(const std::string& folder, int64_t required, const std::wstring& message, bool quiet) {
    int64_t available = 0;
    if (!GetFreeDiskSpace(folder, available)) {
        LOG_AS("Updater", Error) << "GetDiskFreeSpaceEx call failed.";
        return true;
    }
    if (required <= 0 || required < available) return true;
    if (!quiet && !message.empty()) {
        std::wstring text = message;
        text.replace(text.find(L"%d"), 2, std::to_wstring(required / 1000000));
        gui.ShowError(text);
    }
    return false;
}

// Each archive the description declares must arrive as declared; what an
// earlier run kept of those is used or continued, and nothing else of it stays.
std::list<DownloadEntry> Updater::BuildDownloadList(const PatchBatch& batch, PatchInfoFile& description) {
    const std::vector<std::string> names = ArchivesInFetchOrder(description);
    std::list<DownloadEntry> list = MakeDownloadList(names, batch.location, batch.patchFolder);
    auto name = names.begin();
    for (DownloadEntry& entry : list) {
        const auto declared = description.GetDeclaredArchives().find(*name++);
        if (declared == description.GetDeclaredArchives().end()) continue;
        entry.declaredSize = declared->second.size;
        entry.declaredSha256 = declared->second.sha256;
    }
    KeepDeclaredDownloads(list, batch.patchFolder);
    return list;
}
