// The real registry as the system's own reg.exe sees it, and the sandbox that clears the tests' corner of it.
#include <windows.h>
// windows.h first: shlwapi.h needs its types.
#include <gtest/gtest.h>
#include <shlwapi.h>

#include <cstdio>

#include "registry_sandbox.h"
#include "state/registry_manager.h"

namespace {

// Run at the start too, in case an earlier run was cut short.
void Clear(const RegistrySandbox& sandbox) {
    for (const HKEY hive : {HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER}) SHDeleteKeyA(hive, "SOFTWARE\\IronvaleTests");
    SHDeleteKeyA(HKEY_LOCAL_MACHINE, "SOFTWARE\\Wow6432Node\\IronvaleTests");
    SHDeleteKeyA(HKEY_USERS, sandbox.userSid.c_str());
}

std::string CommandOutput(const std::string& command) {
    std::string output;
    FILE* pipe = _popen((command + " 2>&1").c_str(), "r");
    for (int c; pipe != nullptr && (c = std::fgetc(pipe)) != EOF;) output += static_cast<char>(c);
    if (pipe != nullptr) _pclose(pipe);
    return output;
}

// The game's 32-bit installer wrote its machine-wide key into the 32-bit view; the updater must find it there and only
// there. (That the manager and reg.exe read each other's values in the user's hive shows in the Wine scenarios.)
TEST(RegistryRegExe, MachineKeysAreReadInThe32BitView) {
    RegistrySandbox sandbox;
    const std::string machine = "\"HKLM\\" + sandbox.keyPath + "\"";
    CommandOutput("reg.exe add " + machine + " /v \"Install Dir\" /t REG_SZ /d C:\\Thirty /reg:32 /f");
    CommandOutput("reg.exe add " + machine + " /v Language /t REG_SZ /d German /reg:64 /f");
    const RegistryManager machineWide(RegistryHive::LocalMachine, sandbox.keyPath);
    EXPECT_EQ(machineWide.GetInstallDir(), "C:\\Thirty");
    EXPECT_EQ(machineWide.GetLanguage(), "");
    CommandOutput("reg.exe delete " + machine + " /reg:64 /f");
}

}  // namespace

RegistrySandbox::RegistrySandbox() { Clear(*this); }

RegistrySandbox::~RegistrySandbox() { Clear(*this); }
