// The update flow: what the installation is, the plan that decides the
// road (resume an interrupted patch, patch, reinstall the complete build,
// or nothing), and carrying it out, with the complete build offered when
// the patch does not fit the installation.
#include <cstdint>

#include "app/temporary_files.h"
#include "app/updater.h"
#include "base/atomic_file.h"
#include "base/encoding.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "net/signature_check.h"
#include "patch/patch_info_file.h"
#include "text/localization.h"
#include "uninstall/uninstaller.h"

void Updater::RunUpdate() {
    didWork = false;
    for (;;) {
        const UpdateFacts facts = ReadFacts();
        RefuseOlderLatest(facts);
        const UpdateLayout layout = MakeUpdateLayout(configuration, installDir);
        const UpdatePlan plan = PlanUpdate(facts, layout);
        // Work folders of a run that ended before its stage two began, or
        // after it was done, hold nothing to resume; only the archives it
        // kept may serve a batch still to come.
        if (plan.road != Road::Resume) {
            RemoveLeftovers(installDir, layout.patchFolder, layout.patchedFilesFolder, plan.road != Road::UpToDate);
        }
        switch (plan.road) {
            case Road::UpToDate:
                return;
            case Road::Resume:
                gui.SetStatusText(Localize("INSTALLER_PATCHING_AND_DOWNLOADING_STATUS"));
                ResumeBatch(plan.batch, plan.resumeAt, facts.recordedDescription);
                break;
            case Road::Patch:
                ConfirmPatch(facts.installedVersion, facts.latestVersion);
                gui.SetStatusText(Localize("INSTALLER_PATCHING_AND_DOWNLOADING_STATUS"));
                InstallPatch(plan);
                break;
            case Road::Reinstall: {
                gui.SetStatusText(Localize("INSTALLER_REINSTALLING_STATUS"));
                CheckedDescription fetched;
                PatchInfoFile description;
                FetchBuildDescription(plan.batch, fetched, description);
                // The build replaces every file, so no record of an earlier
                // batch may be resumed over it.
                // (One that cannot go is replaced by the build's first record.)
                DiscardFile(progressFile.GetRecordPath());
                DiscardFile(progressFile.GetAlternativeRecordPath());
                InstallBatch(plan.batch, fetched, description);
                break;
            }
        }
        didWork = true;
        // A resumed patch may not have reached the newest version.
        if (plan.road != Road::Resume) return;
    }
}

UpdateFacts Updater::ReadFacts() {
    // This updater never installs into an empty place.
    if (!registry.HasInstallDir()) throw Exception("Corrupt installation.", ErrorCode::CorruptInstallation);
    UpdateFacts facts;
    facts.latestVersion = arguments.latestVersion.empty() ? CheckLatestVersion() : arguments.latestVersion;
    gui.SetStatusText(Localize("INSTALLER_CHECKING_INSTALLATION"));
    installDir = registry.GetInstallDir();
    try {
        installationData.Load(installDir);
    } catch (const Exception&) {
        throw Exception("Corrupt installation.", ErrorCode::CorruptData);
    }
    facts.installedVersion = installationData.currentVersion;
    facts.patcherVersion = installationData.patcherVersion;
    progressFile.SetDirectory(installDir);
    facts.interrupted = FindInterruptedBatch(facts.installedVersion, progressFile);
    if (facts.interrupted.kind == InterruptedBatch::Kind::Resume) {
        // Read from the program's own work folder and checked as a fetched
        // one is, whatever folder the record names.
        const std::string path =
            PathJoin(MakeUpdateLayout(configuration, installDir).patchFolder, configuration.GetPatchInfoFilename());
        CheckedDescription& recorded = facts.recordedDescription;
        try {
            if (!ReadFileBytes(path, kMaximumSignedFileSize, recorded.text) ||
                (!publisherKey.empty() &&
                 !ReadFileBytes(path + ".sig", kMaximumSignatureFileSize, recorded.signature))) {
                throw Exception("The description of the interrupted patch cannot be read: " + path);
            }
            PatchInfoFile description;
            CheckDescription(recorded, facts.interrupted.batch.version, description);
            facts.recordedDescriptionFits = true;
        } catch (const Exception& error) {
            LOG_AS("Updater", Error) << error.message;
        }
    }
    return facts;
}

void Updater::ConfirmPatch(const std::string& installedVersion, const std::string& latestVersion) {
    gui.WaitWhileConfirming();
    if (quitRequested.IsCancelled()) throw Exception("User declined update.", ErrorCode::UserCancelled);
    const std::wstring text =
        Localize("INSTALLER_PATCH_CURRENT_VERSION") + L" " + WidenFromCodePage(installedVersion) + L"\n" +
        Localize("INSTALLER_PATCH_LATEST_VERSION") + L" " + WidenFromCodePage(latestVersion) + L"\n\n" +
        Localize("INSTALLER_PATCH_NEED_LATEST_VERSION") + L"\n" + Localize("INSTALLER_PATCH_CONFIRM_UPADATE") + L"\n";
    if (!gui.AskYesNo(text)) throw Exception("User declined update.", ErrorCode::UserCancelled);
    int32_t exitCode = -1;
    if (!EnsureRights(false, exitCode, true)) throw Exception("User is not Administrator.", ErrorCode::UserCancelled);
}

void Updater::InstallPatch(const UpdatePlan& plan) {
    try {
        CheckedDescription fetched;
        PatchInfoFile description;
        FetchDescription(plan.batch, fetched, description);
        InstallBatch(plan.batch, fetched, description);
    } catch (const Exception& error) {
        if (error.Code() != ErrorCode::DeltaFailed) throw;
        CheckedDescription fetched;
        PatchInfoFile description;
        OfferCompleteBuild(plan.completeBuild, fetched, description, error);
        InstallBatch(plan.completeBuild, fetched, description);
    }
}

// Stage one stopped at an installed file that no longer fits its delta (the
// player or a tool changed it). Nothing is installed yet, and the complete
// build still leads to the latest version without the player having to
// reinstall by hand.
void Updater::OfferCompleteBuild(const PatchBatch& build, CheckedDescription& fetched, PatchInfoFile& description,
                                 const Exception& failure) {
    LOG_AS("Updater", Error) << failure.message;
    try {
        FetchBuildDescription(build, fetched, description);
    } catch (const Exception& error) {
        // Without a complete build there is nothing to offer.
        if (error.Code() == ErrorCode::BuildNotFound) throw failure;
        throw;
    }
    // An unsigned description may declare any sizes: the sum saturates.
    int64_t size = 0;
    for (const auto& archive : description.GetDeclaredArchives()) {
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
