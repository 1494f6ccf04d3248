// Natively: the registry store on disk (a fresh one per sandbox) and the stand-ins for the Windows system facts.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <random>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "registry_sandbox.h"
#include "state/registry_manager.h"
#include "state/system_facts.h"
#include "tests/support/test_files.h"

RegistrySandbox::RegistrySandbox()
    : root(PathJoin(GetTempDirectory(), "ivl-registry-" + std::to_string(std::random_device()()))) {
    ::setenv("IRONVALE_REGISTRY_ROOT", root.c_str(), 1);
}

RegistrySandbox::~RegistrySandbox() {
    ::unsetenv("IRONVALE_REGISTRY_ROOT");
    DiscardDirectory(root);
}

namespace {

TEST(RegistryStore, KeysAreFoldersTheirValuesOneEscapedTextFileAndNamesStayInside) {
    RegistrySandbox sandbox;
    const RegistryManager registry(RegistryHive::CurrentUser, "SOFTWARE\\Halvard\\Ironvale\\");
    registry.SetInstallDir("C:\\Games\\Ironvale");
    registry.SetLanguage("German\r\n");
    const std::string values = sandbox.root + "/HKEY_CURRENT_USER/SOFTWARE/Halvard/Ironvale/.values";
    EXPECT_EQ(ReadTextFile(values), "Install Dir\tC:\\\\Games\\\\Ironvale\nLanguage\tGerman\\x0D\\x0A\n");
    // A hand-edited file is read back, with unknown escapes taken as they are.
    WriteTextFile(values, "Install Dir\tD:\\\\Spiele\\q\nbroken line\nLanguage\tFrench\n");
    EXPECT_EQ(registry.GetInstallDir(), "D:\\Spiele\\q");
    EXPECT_EQ(registry.GetLanguage(), "French");
    // A key blocked by a file reads as missing and cannot be created.
    DiscardDirectory(sandbox.root + "/HKEY_CURRENT_USER/SOFTWARE/Halvard");
    WriteTextFile(sandbox.root + "/HKEY_CURRENT_USER/SOFTWARE/Halvard", "not a key");
    EXPECT_EQ(registry.GetLanguage(), "");
    EXPECT_THROW(registry.SetLanguage("English"), Exception);
    // A SID from the command line becomes part of a key path.
    RegistryManager(RegistryHive::Users, "..\\..\\outside\\.\\a/b").SetLanguage("Italian");
    EXPECT_TRUE(PathExists(sandbox.root + "/HKEY_USERS/%2E./%2E./outside/%2E/a%2Fb/.values"));
    EXPECT_FALSE(PathExists(sandbox.root + "/outside"));
    // Without a root of its own the store lives in the configuration folder.
    ::unsetenv("IRONVALE_REGISTRY_ROOT");
    ::setenv("XDG_CONFIG_HOME", sandbox.root.c_str(), 1);
    registry.SetLanguage("Dutch");
    ::unsetenv("XDG_CONFIG_HOME");
    EXPECT_TRUE(PathExists(sandbox.root + "/ironvale/registry/HKEY_CURRENT_USER/SOFTWARE/Halvard/Ironvale/.values"));
}

TEST(SystemFactsPosix, StandInsMatchTheirWindowsCounterparts) {
    EXPECT_EQ(GetProcessOwnerSid(), "S-1-22-1-" + std::to_string(::geteuid()));
    EXPECT_EQ(GetElevationType(), 0);
    EXPECT_FALSE(IsUacEnabled());
    EXPECT_TRUE(::geteuid() != 0 || IsAdministrator());
    OsInfo record;
    DetectOsName(record);
    EXPECT_EQ(record.osName, "UnknownVersion");
}

}  // namespace
