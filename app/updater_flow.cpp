// The update flow: which version is installed and which is the latest,
// and which of three roads leads from one to the other (resume an
// interrupted patch, patch, or reinstall the complete build), with the
// complete build offered when the patch does not fit the installation.
#include <cstdint>
#include <sstream>

#include "app/temporary_files.h"
#include "app/update_history.h"
#include "app/updater.h"
#include "app/version_text.h"
#include "base/atomic_file.h"
#include "base/encoding.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "net/location.h"
#include "text/localization.h"
#include "uninstall/uninstaller.h"

void Updater::RunUpdate() {
    didWork = false;
    bool reinstall = false;
    for (;;) {
        patchInfoPath.clear();
        patchUrl.clear();
        bool resuming = false;
        stages.emplace(patchInfo, progressFile, applier);

        // This updater never installs into an empty place.
        const bool installed = registry.HasInstallDir();
        if (!installed) throw Exception("Corrupt installation.", ErrorCode::CorruptInstallation);
        if (!arguments.latestVersion.empty()) {
            latestVersion = arguments.latestVersion;
        } else {
            CheckLatestVersion(installed);
        }
        gui.SetStatusText(Localize("INSTALLER_CHECKING_INSTALLATION"));
        installDir = registry.GetInstallDir();
        try {
            installationData.Load(installDir);
        } catch (const Exception&) {
            throw Exception("Corrupt installation.", ErrorCode::CorruptData);
        }
        if (InstallationNeedsUninstall()) throw Exception("Corrupt installation.", ErrorCode::CorruptData);

        if (!reinstall) {
            const std::string localVersion = installationData.currentVersion;
            progressFile.SetDirectory(installDir);
            switch (FindInterruptedBatch(localVersion, progressFile)) {
                case InterruptedBatch::Resume:
                    resuming = true;
                    patchDir = progressFile.GetPatchPath();
                    patchedDir = progressFile.GetPatchedFilesPath();
                    patchUrl = progressFile.GetPatchUri();
                    latestVersion = progressFile.GetVersion();
                    gui.SetStatusText(Localize("INSTALLER_PATCHING_AND_DOWNLOADING_STATUS"));
                    break;
                case InterruptedBatch::Reinstall:
                    reinstall = true;
                    break;
                case InterruptedBatch::None: {
                    // Work folders of a run that ended before its stage two
                    // began, or after it was done, hold nothing to resume.
                    const std::string work = PathJoin(installDir, configuration.GetPatchInstallPath());
                    CleanTemporaryFiles(work, PathJoin(work, configuration.GetPatchedFilesPath()));
                    for (const char* record : {kInstallationDataFileName, kUninstallRecordName}) {
                        RemoveLeftoverReplacement(PathJoin(installDir, record));
                    }
                    if (localVersion.empty()) {
                        throw Exception("Could not establish local version.", ErrorCode::NoLocalVersion);
                    }
                    if (!IsOlderVersion(localVersion, latestVersion)) return;
                    patchUrl = JoinLocation(configuration.GetPatchUrl(), PatchName(kPatchBaseVersion, latestVersion));
                    gui.WaitWhileConfirming();
                    if (gui.IsCancelled()) throw Exception("User declined update.", ErrorCode::UserCancelled);
                    const std::wstring text =
                        Localize("INSTALLER_PATCH_CURRENT_VERSION") + L" " + WidenFromCodePage(localVersion) + L"\n" +
                        Localize("INSTALLER_PATCH_LATEST_VERSION") + L" " + WidenFromCodePage(latestVersion) + L"\n\n" +
                        Localize("INSTALLER_PATCH_NEED_LATEST_VERSION") + L"\n" +
                        Localize("INSTALLER_PATCH_CONFIRM_UPADATE") + L"\n";
                    if (!gui.AskYesNo(text)) throw Exception("User declined update.", ErrorCode::UserCancelled);
                    int32_t exitCode = -1;
                    if (!EnsureRights(false, exitCode, true)) {
                        throw Exception("User is not Administrator.", ErrorCode::UserCancelled);
                    }
                    patchDir = PathJoin(installDir, configuration.GetPatchInstallPath());
                    patchedDir = PathJoin(patchDir, configuration.GetPatchedFilesPath());
                    gui.SetStatusText(Localize("INSTALLER_PATCHING_AND_DOWNLOADING_STATUS"));
                    break;
                }
            }
        }
        if (reinstall && !resuming) {
            gui.SetStatusText(Localize("INSTALLER_REINSTALLING_STATUS"));
            FetchBuildDescription();
            PrepareReinstall();
        }

        LOG_AS("Updater", Info) << "Patch URL:" << patchUrl;
        if (resuming) {
            patchInfoPath = PathJoin(patchDir, configuration.GetPatchInfoFilename());
            patchInfo.Load(patchInfoPath);
            StageTwo(installed);
        } else {
            try {
                RunStageOne(installed);
            } catch (const Exception& error) {
                if (reinstall || error.Code() != ErrorCode::DeltaFailed) throw;
                OfferCompleteBuild(error);
                reinstall = true;
                PrepareReinstall();
                stages.emplace(patchInfo, progressFile, applier);
                LOG_AS("Updater", Info) << "Patch URL:" << patchUrl;
                RunStageOne(installed);
            }
            // A cancel confirmed while stage one finished must not let
            // stage two begin.
            if (cancelled)
                throw Exception("User cancelled before the installation was changed.", ErrorCode::UserCancelled);
            StageTwo(installed);
        }
        AppendUpdateHistory(installDir, patchUrl);
        didWork = true;
        // A resumed patch may not have reached the newest version.
        if (!resuming) return;
    }
}

void Updater::FetchBuildDescription() {
    patchUrl = JoinLocation(configuration.GetCompleteInstallUrl(), BuildName(latestVersion));
    try {
        DownloadPatchInfo(patchUrl, "");
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::PatchNotFound)
            throw Exception("Could not find build.", ErrorCode::BuildNotFound);
        throw;
    }
}

// The build replaces every file, so no record of an earlier batch may be
// resumed over it.
void Updater::PrepareReinstall() {
    patchDir = PathJoin(installDir, configuration.GetPatchInstallPath());
    patchedDir = PathJoin(patchDir, configuration.GetPatchedFilesPath());
    progressFile.SetDirectory(installDir);
    RemoveFile(progressFile.GetRecordPath());
    RemoveFile(progressFile.GetAlternativeRecordPath());
    installationData.SetDirectory(installDir);
}

void Updater::RunStageOne(bool installed) {
    CleanTemporaryFiles(patchDir, patchedDir);
    MakeDirectories(patchDir);
    MakeDirectories(patchedDir);
    if (patchInfoPath.empty()) {
        DownloadPatchInfo(patchUrl, patchDir);
    } else {
        // The reinstall road fetched the description into the temporary
        // folder, before the work folders existed.
        const std::string moved = PathJoin(patchDir, configuration.GetPatchInfoFilename());
        MoveFileReplacing(patchInfoPath, moved);
        patchInfoPath = moved;
    }
    StageOne(installed);
}

// Stage one stopped at an installed file that no longer fits its delta (the
// player or a tool changed it). Nothing is installed yet, and the complete
// build still leads to the latest version without the player having to
// reinstall by hand.
void Updater::OfferCompleteBuild(const Exception& failure) {
    LOG_AS("Updater", Error) << failure.message;
    downloader.RequestStop();
    downloader.WaitForWorker();
    CleanTemporaryFiles(patchDir, patchedDir);
    try {
        FetchBuildDescription();
    } catch (const Exception& error) {
        // Without a complete build there is nothing to offer.
        if (error.Code() == ErrorCode::BuildNotFound) throw failure;
        throw;
    }
    // An unsigned description may declare any sizes: the sum saturates.
    int64_t size = 0;
    for (const auto& archive : patchInfo.GetDeclaredArchives()) {
        size = archive.second.size > INT64_MAX - size ? INT64_MAX : size + archive.second.size;
    }
    std::wstring text =
        Localize("INSTALLER_REPAIR_FILES_CHANGED") + L"\n\n" + Localize("INSTALLER_REPAIR_DOWNLOAD_BUILD");
    if (size > 0) {
        std::wstring line = Localize("INSTALLER_REPAIR_DOWNLOAD_SIZE");
        const size_t at = line.find(L"%d");
        if (at != std::wstring::npos) line.replace(at, 2, std::to_wstring(size / 1000000 + (size % 1000000 != 0)));
        text += L"\n" + line;
    }
    if (!gui.AskYesNo(text)) {
        throw Exception("The complete build was declined. " + failure.message, ErrorCode::CorruptData);
    }
    gui.SetStatusText(Localize("INSTALLER_REINSTALLING_STATUS"));
}

bool Updater::InstallationNeedsUninstall() {
    if (!registry.HasInstallDir()) return false;
    InstallationData other;
    other.Load(registry.GetInstallDir());
    std::istringstream in(other.patcherVersion);
    float version = 1.0f;
    if (!(in >> version)) version = 1.0f;
    if (kUpdaterVersion < version) {
        throw Exception("The installed game has used a newer installer than the current, running one.",
                        ErrorCode::NewerInstaller);
    }
    return kUpdaterVersion > version;
}
