#include "app/updater.h"

#include "app/failure_report.h"
#include "app/language.h"
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

// The entry point selected a stored language; without one the player
// chooses, once, and the choice is kept in the game's key.
bool Updater::SelectLanguage() {
    if (!registry.GetLanguage().empty()) return true;
    std::string name;
    if (!LanguageDialog().Run(name)) return false;
    if (name.empty()) return true;
    try {
        registry.SetLanguage(name);
    } catch (const Exception& error) {
        LOG_AS(kLogSource, Error) << error.message;
    }
    SelectStoredLanguage(name);
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
        if (playOld && !quitRequested.IsCancelled() && !configuration.GetGameExecutable().empty()) StartGame();
        return 1;
    }

    bool startGame = true;
    if (didWork && !quitRequested.IsCancelled()) {
        startGame = gui.AskYesNo(Localize("INSTALLER_SUCCESS_PATCH") + L"\n\n" + Localize("INSTALLER_START_GAME"));
    }
    gui.WaitWhileConfirming();
    gui.Stop();
    if (startGame && !quitRequested.IsCancelled() && !configuration.GetGameExecutable().empty()) StartGame();
    return 1;
}

bool Updater::HandleUpdateFailure(const Exception& error) {
    downloader.RequestStop();
    const FailureReport report = DescribeFailure(error, FailureSite::UpdateRun);
    LogEntry(report.level, kLogSource, __LINE__).Stream() << report.logLine;
    switch (report.notice) {
        case FailureNotice::None:
            // Whatever the player declined or cancelled, nothing more runs,
            // and nothing downloaded for it stays.
            quitRequested.Cancel();
            DiscardDownloads();
            return false;
        case FailureNotice::PlayOldQuestion:
            return gui.AskYesNo(report.text);
        case FailureNotice::ErrorBox:
            gui.ShowError(report.text);
            return false;
    }
    return false;
}

void Updater::DiscardDownloads() {
    // An installation in change keeps its work folders for the next start.
    if (installDir.empty() || installationData.currentVersion == "-1") return;
    downloader.WaitForWorker();
    const UpdateLayout layout = MakeUpdateLayout(configuration, installDir);
    CleanTemporaryFiles(layout.patchFolder, layout.patchedFilesFolder);
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
    // Data flows again: the status line says what it said before.
    if (retrying.exchange(false)) gui.SetStatusText(statusBeforeRetry);
    gui.SetOverallProgress(OverallProgress(doneFiles, totalFiles, bytesDone, bytesTotal));
}

void Updater::OnFileDone(const std::string&) { ++doneFiles; }

void Updater::OnFileRetrying(const std::string&) {
    if (!retrying.exchange(true)) statusBeforeRetry = gui.GetStatusText();
    gui.SetStatusText(Localize("INSTALLER_DOWNLOAD_RETRYING_STATUS"));
}

void Updater::Cancel() {
    quitRequested.Cancel();
    // Wakes a stage waiting for an archive at once.
    downloader.RequestStop();
}
