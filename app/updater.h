#pragma once

#include <atomic>
#include <cstdint>
#include <list>
#include <optional>
#include <string>

#include "app/updater_arguments.h"
#include "base/status_interfaces.h"
#include "net/download_entry.h"
#include "net/http_downloader.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "state/configuration.h"
#include "state/installation_data.h"
#include "state/registry_manager.h"
#include "state/system_facts.h"
#include "ui/gui_manager.h"
#include "ui/move_retry_box.h"

class Exception;

// The one object that carries a run: it owns every long-lived component
// and carries out the mode the command line selects. It turns the workers'
// reports into the window's status line and progress bar, and the window's
// confirmed cancel into stop flags for the workers.
class Updater : public IStatusView, public ICancelable {
public:
    // updateLocation: where the publisher serves the patches (empty: beside
    // the program).
    explicit Updater(const std::string& updateLocation);
    Updater(const Updater&) = delete;
    Updater& operator=(const Updater&) = delete;
    virtual ~Updater();

    // Carries out one invocation; the result is the process exit code.
    int32_t Run(const UpdaterArguments& args);

    void OnApplyProgress(const std::string& fileName, int32_t permille) override;
    void OnFileProgress(const std::string& localPath, uint32_t bytesDone, uint32_t bytesTotal) override;
    void OnFileDone(const std::string& localPath) override;
    void Cancel() override;

private:
    int32_t RunComponentRemoval(const UpdaterArguments& args);
    int32_t RunSettingsRemoval();
    int32_t RunUninstallCleanup();
    int32_t RunUpdateMode();
    bool CheckOperatingSystem();
    bool CheckDirectX();
    bool EnsureRights(bool internallyElevated, int32_t& exitCode, bool needRights);
    bool UninstallNeedsAdministrator();
    bool SelectLanguage();
    // Shows what went wrong and cleans up; true when the player chose to
    // play the installed version.
    bool HandleUpdateFailure(const Exception& error);

    void RunUpdate();
    bool InstallationNeedsUninstall();
    void CheckLatestVersion(bool installed);
    void DownloadPatchInfo(const std::string& location, const std::string& folder);
    // Through the run's downloader; false when the file did not arrive.
    bool FetchOne(const DownloadEntry& entry);
    void CheckDescriptionSignature(const std::string& location);
    void CheckDescriptionContent();
    void FetchBuildDescription();
    void PrepareReinstall();
    // Asks whether to take the complete build instead of a patch that does
    // not fit the installation; throws unless the player says Yes.
    void OfferCompleteBuild(const Exception& failure);
    void RunStageOne(bool installed);
    void StageOne(bool installed);
    void StageTwo(bool installed);
    bool CheckDiskSpace(const std::string& folder, const std::wstring& message, bool quiet);
    std::list<DownloadEntry> BuildDownloadList();
    PatchBatch CurrentBatch() const;
    void WriteUninstallRecord(bool installed);
    void StartGame();

    Configuration configuration;
    RegistryManager registry;
    GuiManager gui;
    std::string latestVersion;
    std::string installDir;
    InstallationData installationData;
    PatchProgressFile progressFile;
    std::string patchDir;
    std::string patchedDir;
    std::string patchInfoPath;
    std::string patchUrl;
    PatchInfoFile patchInfo;
    PatchApplier applier;
    HttpDownloader downloader;
    OsInfo osInfo;
    int32_t totalFiles = 0;
    std::atomic<int32_t> doneFiles{0};
    bool didWork = false;
    std::atomic<bool> cancelled{false};
    bool firstVersionCheck = true;
    std::string registryKeyPath;
    std::string productGuid;
    std::string displayName;
    std::string webSiteHostName;
    UpdaterArguments arguments;
    // PEM; empty when descriptions need no signature.
    const std::string publisherKey;

    // The two stages of the batch of the current pass (a new one each pass,
    // so a resumed batch does not count as prepared).
    std::optional<PatchStages> stages;
    // Asks the player to close files in the way of a move.
    MoveRetryBox retryBox;
};
