// RegistryManager against the platform's registry: the real one under
// Windows, the file store natively. The same expectations hold for both.
#include "state/registry_manager.h"

#include <gtest/gtest.h>

#include "base/exception.h"
#include "registry_sandbox.h"

namespace {

const char* const kInstallDir = "Install Dir";

struct HiveValues {
    const char* localMachine;  // nullptr: the value is not there
    const char* currentUser;
    const char* users;
};

void WriteInstallDirs(const RegistrySandbox& sandbox, const HiveValues& values) {
    if (values.localMachine != nullptr) {
        RegistryManager(RegistryHive::LocalMachine, sandbox.KeyPath()).WriteString(kInstallDir, values.localMachine);
    }
    if (values.currentUser != nullptr) {
        RegistryManager(RegistryHive::CurrentUser, sandbox.KeyPath()).WriteString(kInstallDir, values.currentUser);
    }
    if (values.users != nullptr) {
        RegistryManager(RegistryHive::Users, sandbox.UserSid() + "\\" + sandbox.KeyPath())
            .WriteString(kInstallDir, values.users);
    }
}

TEST(RegistryManagerTest, LocateTakesTheFirstHiveThatNamesAnInstallation) {
    struct Case {
        const char* name;
        HiveValues values;
        bool withSid;
        RegistryHive expectedHive;
        const char* expectedDir;
    };
    const Case cases[] = {
        {"machine first", {"C:\\Machine", "C:\\User", "C:\\Sid"}, true, RegistryHive::LocalMachine, "C:\\Machine"},
        {"blank machine value", {" \t\r\n", "C:\\User", nullptr}, true, RegistryHive::CurrentUser, "C:\\User"},
        {"empty machine value", {"", "C:\\User", nullptr}, false, RegistryHive::CurrentUser, "C:\\User"},
        {"only the starting user's hive", {nullptr, nullptr, "C:\\Sid"}, true, RegistryHive::Users, "C:\\Sid"},
        {"no SID, no user hive", {nullptr, nullptr, "C:\\Sid"}, false, RegistryHive::None, ""},
        {"nothing anywhere", {nullptr, nullptr, nullptr}, true, RegistryHive::None, ""},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        RegistrySandbox sandbox;
        WriteInstallDirs(sandbox, c.values);
        RegistryManager registry;
        const std::string sid = c.withSid ? sandbox.UserSid() : std::string();
        EXPECT_EQ(registry.Locate(sandbox.KeyPath(), sid), c.expectedHive != RegistryHive::None);
        EXPECT_EQ(registry.GetHive(), c.expectedHive);
        EXPECT_EQ(registry.GetInstallDir(), c.expectedDir);
        if (c.expectedHive == RegistryHive::Users) {
            EXPECT_EQ(registry.GetKeyPath(), sandbox.UserSid() + "\\" + sandbox.KeyPath());
        } else if (c.expectedHive == RegistryHive::None) {
            EXPECT_EQ(registry.GetKeyPath(), "");
        } else {
            EXPECT_EQ(registry.GetKeyPath(), sandbox.KeyPath());
        }
    }
}

TEST(RegistryManagerTest, InstallDirIsTrimmedAndLanguageIsNot) {
    RegistrySandbox sandbox;
    const RegistryManager registry(RegistryHive::CurrentUser, sandbox.KeyPath());
    registry.SetInstallDir(" C:\\Game \r\n");
    registry.SetLanguage(" German ");
    EXPECT_EQ(registry.GetInstallDir(), "C:\\Game");
    EXPECT_TRUE(registry.HasInstallDir());
    EXPECT_EQ(registry.GetLanguage(), " German ");
    std::string raw;
    ASSERT_TRUE(registry.ReadString(kInstallDir, raw));
    EXPECT_EQ(raw, " C:\\Game \r\n");

    registry.SetInstallDir("\t \n");
    EXPECT_EQ(registry.GetInstallDir(), "");
    EXPECT_FALSE(registry.HasInstallDir());
}

TEST(RegistryManagerTest, WritingCreatesMissingKeysAndReplacesValues) {
    RegistrySandbox sandbox;
    const std::string deep = sandbox.KeyPath() + "\\Not\\There\\Yet";
    const RegistryManager registry(RegistryHive::CurrentUser, deep);
    std::string value = "untouched";
    EXPECT_FALSE(registry.ReadString("Language", value));
    EXPECT_EQ(value, "untouched");

    registry.SetLanguage("Polish");
    registry.SetLanguage("Japanese");
    ASSERT_TRUE(registry.ReadString("Language", value));
    EXPECT_EQ(value, "Japanese");
    // Registry names ignore case, in key paths and value names alike.
    const RegistryManager otherCase(RegistryHive::CurrentUser, sandbox.KeyPath() + "\\NOT\\there\\YET");
    EXPECT_EQ(otherCase.GetLanguage(), "Japanese");
    otherCase.WriteString("LANGUAGE", "Russian");
    EXPECT_EQ(registry.GetLanguage(), "Russian");
    // The other hives did not get the key.
    EXPECT_EQ(RegistryManager(RegistryHive::LocalMachine, deep).GetLanguage(), "");
}

TEST(RegistryManagerTest, ReadingStopsAtTheFirstZeroAndKeepsEmptyValues) {
    RegistrySandbox sandbox;
    const RegistryManager registry(RegistryHive::CurrentUser, sandbox.KeyPath());
    registry.WriteString("Cut", std::string("before\0after", 12));
    registry.WriteString("Empty", "");
    registry.WriteString("Text", "Ironvale \xC3\xA9 \\ \"quoted\" line\nnext\ttab");
    std::string value;
    ASSERT_TRUE(registry.ReadString("Cut", value));
    EXPECT_EQ(value, "before");
    value = "stale";
    ASSERT_TRUE(registry.ReadString("Empty", value));
    EXPECT_EQ(value, "");
    ASSERT_TRUE(registry.ReadString("Text", value));
    EXPECT_EQ(value, "Ironvale \xC3\xA9 \\ \"quoted\" line\nnext\ttab");
    EXPECT_FALSE(registry.ReadString("Missing", value));
}

TEST(RegistryManagerTest, FailedWritesThrowRegistryFailed) {
    RegistrySandbox sandbox;
    struct Case {
        const char* name;
        RegistryManager registry;
        std::string valueName;
        std::string expectedMessage;
    };
    // Windows allows 255 characters in a key name and 16383 in a value name.
    const std::string longKey = sandbox.KeyPath() + "\\" + std::string(300, 'k');
    const std::string longValue(16384, 'v');
    const Case cases[] = {
        {"no hive", RegistryManager(RegistryHive::None, sandbox.KeyPath()), "Language",
         "Failed to create registry key: " + sandbox.KeyPath()},
        {"key name too long", RegistryManager(RegistryHive::CurrentUser, longKey), "Language",
         "Failed to create registry key: " + longKey},
        {"value name too long", RegistryManager(RegistryHive::CurrentUser, sandbox.KeyPath()), longValue,
         "Failed to write registry value: " + longValue},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        try {
            c.registry.WriteString(c.valueName, "x");
            ADD_FAILURE() << "no exception";
        } catch (const Exception& error) {
            EXPECT_EQ(error.message, c.expectedMessage);
            EXPECT_EQ(error.Code(), ErrorCode::RegistryFailed);
        }
    }
    // A failed value leaves the key's other values alone.
    const RegistryManager registry(RegistryHive::CurrentUser, sandbox.KeyPath());
    EXPECT_EQ(registry.GetLanguage(), "");
    registry.SetLanguage("Spanish");
    EXPECT_THROW(registry.WriteString(longValue, "x"), Exception);
    EXPECT_EQ(registry.GetLanguage(), "Spanish");
}

}  // namespace
