// The native registry store on disk: where keys and values land, and that
// names from outside (a SID from the command line) stay inside the store.
#include <gtest/gtest.h>
#include <stdlib.h>

#include <filesystem>
#include <string>

#include "base/exception.h"
#include "base/paths.h"
#include "state/registry_manager.h"
#include "tests/support/test_files.h"

namespace {

// Points the store at a fresh folder for one test.
class StoreRoot {
public:
    StoreRoot() { ::setenv("IRONVALE_REGISTRY_ROOT", (folder / "registry").c_str(), 1); }
    ~StoreRoot() { ::unsetenv("IRONVALE_REGISTRY_ROOT"); }
    std::string Path(const std::string& relative) const { return folder / relative; }

private:
    TempFolder folder;
};

TEST(RegistryStoreTest, KeysAreFoldersAndValuesOneEscapedTextFile) {
    StoreRoot store;
    const RegistryManager registry(RegistryHive::CurrentUser, "SOFTWARE\\Halvard\\Ironvale\\");
    registry.SetInstallDir("C:\\Games\\Ironvale");
    registry.SetLanguage("German\r\n");
    const std::string values = store.Path("registry/HKEY_CURRENT_USER/SOFTWARE/Halvard/Ironvale/.values");
    EXPECT_EQ(ReadTextFile(values), "Install Dir\tC:\\\\Games\\\\Ironvale\nLanguage\tGerman\\x0D\\x0A\n");
    // A hand-edited file is read back, with unknown escapes taken as they are.
    WriteTextFile(values, "Install Dir\tD:\\\\Spiele\\q\nbroken line\nLanguage\tFrench\n");
    EXPECT_EQ(registry.GetInstallDir(), "D:\\Spiele\\q");
    EXPECT_EQ(registry.GetLanguage(), "French");
    EXPECT_FALSE(PathExists(values + ".tmp"));
    EXPECT_FALSE(PathExists(store.Path("registry/HKEY_CURRENT_USER/SOFTWARE/Halvard/Ironvale/.values.tmp")));
}

TEST(RegistryStoreTest, KeyNamesCannotLeaveTheStore) {
    StoreRoot store;
    // A SID from the command line becomes part of the key path.
    RegistryManager registry;
    EXPECT_FALSE(registry.Locate("SOFTWARE\\Halvard\\Ironvale", "../../../outside"));
    RegistryManager(RegistryHive::Users, "..\\..\\outside\\.\\a/b").SetLanguage("Italian");
    EXPECT_FALSE(PathExists(store.Path("outside")));
    EXPECT_FALSE(PathExists(store.Path("registry/outside")));
    EXPECT_TRUE(PathExists(store.Path("registry/HKEY_USERS/%2E./%2E./outside/%2E/a%2Fb/.values")));
    EXPECT_EQ(RegistryManager(RegistryHive::Users, "..\\..\\outside\\.\\a/b").GetLanguage(), "Italian");
}

TEST(RegistryStoreTest, AKeyBlockedByAFileCannotBeCreated) {
    StoreRoot store;
    const RegistryManager registry(RegistryHive::LocalMachine, "SOFTWARE\\Halvard\\Ironvale");
    registry.SetLanguage("English");
    DeleteDirectory(store.Path("registry/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard"), true);
    WriteTextFile(store.Path("registry/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard"), "not a key");
    EXPECT_EQ(registry.GetLanguage(), "");
    try {
        registry.SetLanguage("English");
        ADD_FAILURE() << "no exception";
    } catch (const Exception& error) {
        EXPECT_EQ(error.message, "Failed to create registry key: SOFTWARE\\Halvard\\Ironvale");
        EXPECT_EQ(error.Code(), ErrorCode::RegistryFailed);
    }
}

TEST(RegistryStoreTest, TheDefaultRootFollowsTheConfigFolder) {
    TempFolder config;
    ::unsetenv("IRONVALE_REGISTRY_ROOT");
    const char* previous = std::getenv("XDG_CONFIG_HOME");
    const std::string saved = previous != nullptr ? previous : "";
    ::setenv("XDG_CONFIG_HOME", config.Path().c_str(), 1);
    RegistryManager(RegistryHive::LocalMachine, "SOFTWARE\\Halvard\\Ironvale").SetInstallDir("/opt/ironvale");
    EXPECT_TRUE(PathExists(config / "ironvale/registry/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard/Ironvale/.values"));
    RegistryManager registry;
    EXPECT_TRUE(registry.Locate("Software\\halvard\\IRONVALE", ""));
    EXPECT_EQ(registry.GetInstallDir(), "/opt/ironvale");
    if (previous != nullptr) {
        ::setenv("XDG_CONFIG_HOME", saved.c_str(), 1);
    } else {
        ::unsetenv("XDG_CONFIG_HOME");
    }
}

}  // namespace
