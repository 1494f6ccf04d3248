#pragma once

#include <atomic>
#include <cstdint>
#include <string>

#include "app/update_plan.h"
#include "app/updater_arguments.h"
#include "base/cancellation.h"
#include "base/status_interfaces.h"
#include "net/http_downloader.h"
#include "patch/patch_progress_file.h"
#include "state/configuration.h"
#include "state/installation_data.h"
#include "state/registry_manager.h"
#include "state/system_facts.h"
#include "ui/gui_manager.h"
#include "ui/retry_box.h"

class Exception;
class PatchInfoFile;

// The one object that carries a run: it owns every long-lived component
// and carries out the mode the command line selects. It turns the workers'
// reports into the window's status line and progress bar, and the window's
// confirmed cancel into the run's one cancellation token. What one patch
// or build needs travels as a PatchBatch from the run's plan; nothing of
// it is kept here.
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
    void OnFileRetrying(const std::string& localPath) override;
    void Cancel() override;

private:
    // The modes (updater_modes.cpp, updater.cpp).
    int32_t RunComponentRemoval(const UpdaterArguments& args);
    int32_t RunSettingsRemoval();
    int32_t RunUninstallCleanup();
    int32_t RunUpdateMode();
    // Shows what went wrong; true when the player chose to play the
    // installed version.
    bool HandleUpdateFailure(const Exception& error);
    // Removes the work folders, kept archives included, unless the
    // installation is in change.
    void DiscardDownloads();
    void StartGame();

    // The checks before an update (updater_checks.cpp).
    bool SelectLanguage();
    bool CheckOperatingSystem();
    bool CheckDirectX();
    bool EnsureRights(bool internallyElevated, int32_t& exitCode, bool needRights);
    bool UninstallNeedsAdministrator();

    // The update flow: what the installation is, the plan, and its roads
    // (updater_flow.cpp).
    void RunUpdate();
    UpdateFacts ReadFacts();
    void ConfirmPatch(const std::string& installedVersion, const std::string& latestVersion);
    void InstallPatch(const UpdatePlan& plan);
    // Asks whether to take the complete build instead of a patch that does
    // not fit the installation; throws unless the player says Yes. The
    // build's description is fetched and checked for the question.
    void OfferCompleteBuild(const PatchBatch& build, CheckedDescription& fetched, PatchInfoFile& description,
                            const Exception& failure);

    // The version and the descriptions (updater_version_check.cpp).
    std::string CheckLatestVersion();
    // Throws VersionUnconfirmed unless the publisher's statement beside
    // "version.txt" confirms latest; keeps its serial in the game's key.
    void ConfirmLatestVersion(const std::string& latest);
    // Logs, in a program with a key, a latest version older than the
    // installed one: refused.
    void RefuseOlderLatest(const UpdateFacts& facts) const;
    // Fetches a patch's description as FetchCheckedDescription does; a
    // program with a key also refuses one that does not start from the
    // installed version (DeltaFailed: the complete build is offered).
    void FetchDescription(const PatchBatch& batch, CheckedDescription& fetched, PatchInfoFile& description);
    // Fetches the batch's description (and its signature in a program with
    // a key), checks it and parses it into description.
    void FetchCheckedDescription(const PatchBatch& batch, CheckedDescription& fetched, PatchInfoFile& description);
    // The same for a complete build; a missing one is BuildNotFound.
    void FetchBuildDescription(const PatchBatch& build, CheckedDescription& fetched, PatchInfoFile& description);
    // The bytes at url, at most limit of them, through the run's downloader
    // and a temporary file of its own; false when they did not arrive.
    bool FetchBytes(const std::string& url, int64_t limit, bool signUrl, std::string& bytes);
    // Throws CorruptData unless checked is what the program takes for a
    // batch leading to version: signed by its key (when it has one) and
    // saying so; parses it into description.
    void CheckDescription(const CheckedDescription& checked, const std::string& version, PatchInfoFile& description);

    // One batch's two stages (updater_stages.cpp).
    // Runs both stages of batch, with its description as it was checked.
    void InstallBatch(const PatchBatch& batch, const CheckedDescription& checked, PatchInfoFile& description);
    void ResumeBatch(const PatchBatch& batch, const ResumePoint& resumeAt, const CheckedDescription& checked);
    void StageOne(PatchStages& stages, const PatchBatch& batch, PatchInfoFile& description);
    // Stage two, then the work folders go.
    void StageTwo(PatchStages& stages, const PatchBatch& batch, const std::optional<ResumePoint>& resumeAt);
    // Stops the downloads and, unless the installation is in change (an
    // interrupted stage two keeps its files for the next start), removes
    // what the batch prepared and, unless failure is a download that did not
    // arrive, what it downloaded: an archive may be gigabytes.
    void AbandonBatch(const PatchBatch& batch, const Exception& failure);
    bool CheckDiskSpace(const std::string& folder, int64_t required, const std::wstring& message, bool quiet);
    std::list<DownloadEntry> BuildDownloadList(const PatchBatch& batch, PatchInfoFile& description);
    StageServices Services();

    Configuration configuration;
    RegistryManager registry;
    GuiManager gui;
    std::string installDir;
    InstallationData installationData;
    PatchProgressFile progressFile;
    // The player's cancel, read by every worker; set by Cancel and kept for
    // the rest of the run.
    CancellationToken quitRequested;
    HttpDownloader downloader{&quitRequested};
    OsInfo osInfo;
    int32_t totalFiles = 0;
    std::atomic<int32_t> doneFiles{0};
    // A transfer is being tried again; the status line it replaced (both
    // are the downloader thread's).
    std::atomic<bool> retrying{false};
    std::wstring statusBeforeRetry;
    bool didWork = false;
    bool firstVersionCheck = true;
    std::string registryKeyPath;
    std::string productGuid;
    std::string displayName;
    std::string webSiteHostName;
    UpdaterArguments arguments;
    // The publisher's public keys (PEM, one or more); empty when nothing
    // needs a signature.
    const std::string publisherKey;
    // Asks the player to close files in the way of a move.
    RetryBox retryBox;
};
