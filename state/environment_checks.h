#pragma once

#include <cstdint>
#include <string>
#include <vector>

// The checks that come before an update: may the updater run on this
// system, and does it hold the rights it needs. The decisions are made
// here over a few facts; the program reads the facts from the system and
// shows the boxes, the tests feed any facts they like.

// What the checks read from the machine.
class IMachineFacts {
public:
    virtual std::string OsName() = 0;
    // 1 default, 2 full, 3 limited; 0 when it cannot be read.
    virtual int32_t ElevationType() = 0;
    virtual bool IsAdministrator() = 0;
    virtual bool IsUacEnabled() = 0;

protected:
    IMachineFacts() = default;
    IMachineFacts(const IMachineFacts&) = default;
    IMachineFacts& operator=(const IMachineFacts&) = default;
    ~IMachineFacts() = default;
};

// The facts of this machine and process (the OS name detected once).
class SystemMachineFacts final : public IMachineFacts {
public:
    std::string OsName() override;
    int32_t ElevationType() override;
    bool IsAdministrator() override;
    bool IsUacEnabled() override;

private:
    std::string osName;
};

// Listed systems pass, and so does one newer than every known name
// ("UnknownVersion").
bool IsSupportedOs(const std::string& osName, const std::vector<std::string>& supportedOsNames);

// The DirectX "Version" value reads like "4.09.00.0904": its second part
// is the major version. Passes when the required or the installed major is
// 0, or when the value has at least three parts and a large enough major.
bool IsDirectXSufficient(const std::string& installedText, const std::string& requiredText);

bool IsVistaOrWindows7(const std::string& osName);

struct AdminRights {
    bool granted = false;     // the process may write where the update writes
    bool uacOn = false;       // User Account Control is on
    bool canElevate = false;  // an elevated copy would get the rights
};
// Reads the rights from the facts, logging how it decided.
AdminRights CheckAdminRights(IMachineFacts& facts);

// What the rights check ends in.
enum class RightsOutcome {
    Granted,             // go on
    Elevate,             // start an elevated copy and end with its exit code
    NoRightsForRemoval,  // the old installation's removal needs rights nobody can grant
    NoRights,            // rights are needed and UAC cannot grant them
};
// needRights: the update is about to write into the installation. An
// installation that must first be uninstalled needs the rights its
// uninstall needs; no installation at all needs full rights.
RightsOutcome DecideRights(const AdminRights& rights, bool installationFound, bool needsUninstall,
                           bool uninstallNeedsAdministrator, bool needRights);

// The elevated copy's command line: this process's own, then
// " -internallyElevated 1 -SID " and the user's SID, so the copy works on
// the starting user's settings.
std::string ElevatedCommandLine(const std::string& ownCommandLine, const std::string& sid);
