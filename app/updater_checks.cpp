// The checks before an update: operating system, Steam edition, rights
// (with the elevated copy of this program) and DirectX.
#include "app/update_plan.h"
#include "app/updater.h"
#include "base/exception.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "state/environment_checks.h"
#include "state/processes.h"
#include "text/localization.h"
#include "ui/message_box.h"
#include "uninstall/uninstaller.h"

bool Updater::CheckOperatingSystem() {
    SystemMachineFacts facts;
    osInfo.osName = facts.OsName();
    osInfo.detected = true;
    if (IsSupportedOs(osInfo.osName, configuration.GetSupportedOsNames())) return true;
    LOG(Error) << "This OS is not supported.";
    ShowTitledMessage(Localize("INSTALLER_UNSUPPORTED_OS"), MessageIcon::Error);
    return false;
}

bool Updater::CheckDirectX() {
    std::string installed;
    RegistryManager(RegistryHive::LocalMachine, "SOFTWARE\\Microsoft\\DirectX\\").ReadString("Version", installed);
    if (IsDirectXSufficient(installed, configuration.GetRequiredDirectXVersion())) return true;
    LOG(Error) << "DirectX version not supported: " << installed;
    ShowTitledMessage(Localize("INSTALLER_WRONG_DIRECTXVERSION") + L"\n" + Localize("INSTALLER_UPDATE_DIRECTXVERSION"),
                      MessageIcon::Error);
    return false;
}

bool Updater::UninstallNeedsAdministrator() {
    if (!registry.HasInstallDir()) return false;
    try {
        return Uninstaller(PathJoin(registry.GetInstallDir(), kUninstallRecordName)).GetHive() ==
               RegistryHive::LocalMachine;
    } catch (const Exception& error) {
        // Without a record there is nothing for the removal to delete.
        LOG(Error) << error.message;
        return false;
    }
}

bool Updater::EnsureRights(bool internallyElevated, int32_t& exitCode, bool needRights) {
    if (internallyElevated) {
        LOG(Trace) << "Process is internally elevated.";
        return true;
    }
    SystemMachineFacts facts;
    const AdminRights rights = CheckAdminRights(facts);
    const bool found = registry.HasInstallDir();
    bool needsUninstall = false;
    if (found) {
        InstallationData installed;
        installed.Load(registry.GetInstallDir());
        needsUninstall = InstallationNeedsUninstall(installed.patcherVersion);
    }
    switch (DecideRights(rights, found, needsUninstall, needsUninstall && UninstallNeedsAdministrator(), needRights)) {
        case RightsOutcome::Granted:
            return true;
        case RightsOutcome::Elevate: {
            const std::string commandLine = ElevatedCommandLine(GetOwnCommandLine(), GetProcessOwnerSid());
            // The copy writes to the same log.
            Log::Close();
            exitCode = RunElevated(commandLine, "");
            return false;
        }
        case RightsOutcome::NoRightsForRemoval:
            ShowTitledMessage(
                Localize("INSTALLER_POWERUSER_NOT_ENOUGH") + L"\n" + Localize("INSTALLER_LOG_ON_AS_ADMINISTRATOR"),
                MessageIcon::Warning);
            return false;
        case RightsOutcome::NoRights:
            ShowTitledMessage(IsVistaOrWindows7(facts.OsName())
                                  ? Localize("INSTALLER_UAC_IS_OFF") + L"\n" + Localize("INSTALLER_UAC_TURN_ON") +
                                        L"\n" + Localize("INSTALLER_LOG_ON_AS_ADMINISTRATOR")
                                  : Localize("INSTALLER_POWERUSER_NOT_ENOUGH") + L"\n" +
                                        Localize("INSTALLER_LOG_ON_AS_ADMINISTRATOR"),
                              MessageIcon::Warning);
            return false;
    }
    return false;
}
