#include "state/environment_checks.h"

#include <algorithm>
#include <cstdlib>

#include "base/log.h"
#include "state/system_facts.h"

std::string SystemMachineFacts::OsName() {
    if (osName.empty()) {
        OsInfo info;
        DetectOsName(info);
        osName = info.osName;
    }
    return osName;
}

int32_t SystemMachineFacts::ElevationType() { return GetElevationType(); }

bool SystemMachineFacts::IsAdministrator() { return ::IsAdministrator(); }

bool SystemMachineFacts::IsUacEnabled() { return ::IsUacEnabled(); }

bool IsSupportedOs(const std::string& osName, const std::vector<std::string>& supportedOsNames) {
    return osName == "UnknownVersion" ||
           std::find(supportedOsNames.begin(), supportedOsNames.end(), osName) != supportedOsNames.end();
}

bool IsDirectXSufficient(const std::string& installedText, const std::string& requiredText) {
    std::vector<std::string> parts;
    size_t start = 0;
    while (start <= installedText.size()) {
        const size_t dot = std::min(installedText.find('.', start), installedText.size());
        if (dot > start) parts.push_back(installedText.substr(start, dot - start));
        start = dot + 1;
    }
    const int required = std::atoi(requiredText.c_str());
    const int installed = parts.size() >= 2 ? std::atoi(parts[1].c_str()) : -1;
    if (required == 0 || installed == 0) return true;
    return parts.size() >= 3 && installed >= required;
}

bool IsVistaOrWindows7(const std::string& osName) { return osName == "Vista" || IsWindows7(osName); }

AdminRights CheckAdminRights(IMachineFacts& facts) {
    AdminRights rights;
    const auto administrator = [&facts] {
        const bool yes = facts.IsAdministrator();
        LOG(Trace) << (yes ? "User is administrator." : "User is not administrator.");
        return yes;
    };
    if (!IsVistaOrWindows7(facts.OsName())) {
        LOG(Trace) << "OS is XP.";
        rights.granted = administrator();
        return rights;
    }
    LOG(Trace) << "OS is Vista or windows 7.";
    LOG(Trace) << "Checking UAC and elevation status.";
    switch (facts.ElevationType()) {
        case 3:
            LOG(Trace) << "UAC is enabled and user is not elevated.";
            rights.uacOn = rights.canElevate = true;
            break;
        case 2:
            LOG(Trace) << "UAC is enabled and user is elevated.";
            rights.granted = true;
            break;
        case 1:
            LOG(Trace) << "UAC is disabled and/or user is standard user.";
            rights.granted = administrator();
            if (!rights.granted && facts.IsUacEnabled()) rights.uacOn = true;
            break;
        default:
            LOG(Trace) << "Unable to get elevation type.";
    }
    return rights;
}

RightsOutcome DecideRights(const AdminRights& rights, bool installationFound, bool needsUninstall,
                           bool uninstallNeedsAdministrator, bool needRights) {
    if (!installationFound) {
        LOG(Trace) << "No installation found.";
        needRights = true;
    } else {
        LOG(Trace) << "Installation found.";
        if (needsUninstall) {
            LOG(Trace) << "Installation needs to be uninstalled.";
            if (uninstallNeedsAdministrator) {
                LOG(Trace) << "Uninstall needs admin rights.";
                if (!rights.granted && !rights.uacOn) {
                    LOG(Info) << "Uninstall needs admin rights but the user can't be elevated.";
                    return RightsOutcome::NoRightsForRemoval;
                }
                needRights = true;
            }
        }
    }
    if (rights.uacOn) {
        if (!needRights) return RightsOutcome::Granted;
        if (!rights.granted) return RightsOutcome::Elevate;
    }
    return !needRights || rights.granted ? RightsOutcome::Granted : RightsOutcome::NoRights;
}

std::string ElevatedCommandLine(const std::string& ownCommandLine, const std::string& sid) {
    return ownCommandLine + " -internallyElevated 1 -SID " + sid;
}
