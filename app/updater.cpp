#include "app/updater.h"

#include "app/overall_progress.h"
#include "app/publisher_key.h"
#include "app/temporary_files.h"
#include "base/encoding.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "net/sign_url.h"
#include "state/processes.h"
#include "text/localization.h"
#include "ui/language_dialog.h"

namespace {

const char* const kLogSource = "Updater";

}  // namespace

Updater::Updater(const std::string& updateLocation) : publisherKey(BuiltInPublisherKey()) {
    applier.SetRetryQuestion(&retryBox);
    configuration.SetDefaults(updateLocation);
}

Updater::~Updater() = default;

int32_t Updater::Run(const UpdaterArguments& args) {
    if (args.kdlGlRemove) return RunComponentRemoval(args);
    arguments = args;
    if (arguments.doRemoveSettings) return RunSettingsRemoval();
    if (arguments.doUninstallCleanup) return RunUninstallCleanup();
    return RunUpdateMode();
}

// The player chooses a language once; it is kept in the game's key.
bool Updater::SelectLanguage() {
    std::string name = registry.GetLanguage();
    if (name.empty()) {
        LanguageDialog dialog;
        if (!dialog.Run(name)) return false;
        if (!name.empty()) {
            try {
                registry.SetLanguage(name);
            } catch (const Exception& error) {
                LOG_AS(kLogSource, Error) << error.message;
            }
        }
    }
    if (!name.empty()) Localization::SetLanguage(name.substr(0, name.find(' ')));
    return true;
}

int32_t Updater::RunUpdateMode() {
    SetServerClockOffset(arguments.serverDeltaTime);
    webSiteHostName = arguments.hostName;
    productGuid = configuration.GetProductGuid();
    displayName = configuration.GetDisplayName();
    registryKeyPath = configuration.GetRegistryKey();
    registry.Locate(registryKeyPath, arguments.sid);
    if (!SelectLanguage()) return -1;
    if (!CheckOperatingSystem()) return -1;
    if (IsSteamEdition(registry.GetInstallDir())) {
        throw Exception("Incompatible with Steam version.", ErrorCode::SteamIncompatible);
    }
    int32_t exitCode = -1;
    if (!EnsureRights(arguments.internallyElevated, exitCode, false)) return exitCode;
    if (!CheckDirectX()) return -1;

    gui.Start(this);
    gui.Show();
    bool updateOk = false;
    bool playOld = false;
    try {
        RunUpdate();
        updateOk = true;
    } catch (const Exception& error) {
        playOld = HandleUpdateFailure(error);
    }
    // No transfer may run while the player reads the outcome.
    downloader.RequestStop();
    if (!updateOk) {
        gui.Stop();
        if (playOld && !cancelled && !configuration.GetGameExecutable().empty()) StartGame();
        return 1;
    }

    installationData.Save();
    bool startGame = true;
    if (didWork && !cancelled) {
        startGame = gui.AskYesNo(Localize("INSTALLER_SUCCESS_PATCH") + L"\n\n" + Localize("INSTALLER_START_GAME"));
    }
    gui.WaitWhileConfirming();
    gui.Stop();
    if (startGame && !cancelled && !configuration.GetGameExecutable().empty()) StartGame();
    return 1;
}

bool Updater::HandleUpdateFailure(const Exception& error) {
    const auto question = [](const char* what) {
        return Localize(what) + L"\n\n" + Localize("INSTALLER_ERROR_CONNECTION") + L"\n\n" +
               Localize("INSTALLER_ERROR_PLAY_OLD_VERSION");
    };
    // Whatever ended the run, what it downloaded and prepared goes, so the
    // installation is left as it was found (an archive may be gigabytes);
    // an interrupted stage two keeps its files for the next start.
    downloader.RequestStop();
    downloader.WaitForWorker();
    if (installationData.currentVersion != "-1") {
        if (!patchInfoPath.empty()) RemoveFile(patchInfoPath);
        CleanTemporaryFiles(patchDir, patchedDir);
    }
    switch (error.Code()) {
        case ErrorCode::UserCancelled:
            LOG_AS(kLogSource, Info) << "User cancelled:" << error.message;
            cancelled = true;
            return false;
        case ErrorCode::PatchNotFound:
            LOG_AS(kLogSource, Error) << "Patch not found.";
            return gui.AskYesNo(question("INSTALLER_ERROR_NO_PATCH_FOUND"));
        case ErrorCode::FileNotFound:
            LOG_AS(kLogSource, Error) << "File not found.";
            return gui.AskYesNo(question("INSTALLER_ERROR_FILE_NOT_FOUND"));
        case ErrorCode::CorruptData:
            LOG_AS(kLogSource, Error) << "Corrupt data.";
            gui.ShowError(Localize("INSTALLER_ERROR_CORRUPT_DATA") + L"\n\n" + Localize("INSTALLER_ERROR_REINSTALL"));
            return false;
        case ErrorCode::CorruptInstallation:
            LOG_AS(kLogSource, Error) << "Corrupt installation.";
            gui.ShowError(Localize("INSTALLER_GAME_IS_NOT_INSTALLED"));
            return false;
        case ErrorCode::SteamIncompatible:
            LOG_AS(kLogSource, Error) << "Incompatible with Steam version.";
            gui.ShowError(Localize("INSTALLER_INCOMPATIBLE_WITH_STEAM"));
            return false;
        default:
            LOG_AS(kLogSource, Fatal) << "Unknown exception type caught:" << error.message;
            gui.ShowError(Localize("INSTALLER_ERROR_OCCURRED") + L"\n" + error.wideMessage);
            return false;
    }
}

void Updater::StartGame() {
    RunProcess(
        PathJoin(registry.GetInstallDir(), configuration.GetGameExecutable()),
        GameParameters(configuration.GetGameParameters(), arguments.sessionId, arguments.dataCenters, webSiteHostName),
        false);
}

void Updater::OnApplyProgress(const std::string& fileName, int32_t permille) {
    gui.SetFileProgress(permille);
    gui.SetStatusText(Localize("INSTALLER_WINDOW_FILE") + L" " + WidenFromCodePage(fileName));
}

void Updater::OnFileProgress(const std::string&, uint32_t bytesDone, uint32_t bytesTotal) {
    gui.SetOverallProgress(OverallProgress(doneFiles, totalFiles, bytesDone, bytesTotal));
}

void Updater::OnFileDone(const std::string&) { ++doneFiles; }

void Updater::Cancel() {
    cancelled = true;
    applier.RequestCancel();
    downloader.RequestStop();
}
