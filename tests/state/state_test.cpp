// The registry manager (on the real registry under Windows, the file store natively), installation data, system facts.
#include <gtest/gtest.h>

#include <tuple>

#include "base/exception.h"
#include "registry_sandbox.h"
#include "state/installation_data.h"
#include "state/registry_manager.h"
#include "state/system_facts.h"
#include "tests/support/test_files.h"

namespace {

TEST(RegistryManager, LocateTakesTheFirstHiveThatNamesAnInstallation) {
    const struct {
        const char* dirs[3];  // under the local machine, the current user, the SID's hive
        bool withSid;
        int found;  // which of them; -1: none
    } cases[] = {
        {{"C:\\Machine", "C:\\User", "C:\\Sid"}, true, 0},
        {{nullptr, nullptr, "C:\\Sid"}, true, 2},
        {{nullptr, nullptr, "C:\\Sid"}, false, -1},
    };
    for (const auto& item : cases) {
        RegistrySandbox sandbox;
        const RegistryManager places[] = {{RegistryHive::LocalMachine, sandbox.keyPath},
                                          {RegistryHive::CurrentUser, sandbox.keyPath},
                                          {RegistryHive::Users, sandbox.userSid + "\\" + sandbox.keyPath}};
        for (int i = 0; i < 3; ++i) {
            if (item.dirs[i] != nullptr) places[i].SetInstallDir(item.dirs[i]);
        }
        RegistryManager registry;
        EXPECT_EQ(registry.Locate(sandbox.keyPath, item.withSid ? sandbox.userSid : ""), item.found >= 0);
        EXPECT_EQ(registry.GetHive(), item.found < 0 ? RegistryHive::None : places[item.found].GetHive());
        EXPECT_EQ(registry.GetKeyPath(), item.found < 0 ? "" : places[item.found].GetKeyPath());
        EXPECT_EQ(registry.GetInstallDir(), item.found < 0 ? "" : item.dirs[item.found]);
    }
}

TEST(RegistryManager, ValuesAreReadAsWrittenUpToAZeroAndFailedWritesThrow) {
    RegistrySandbox sandbox;
    const RegistryManager registry(RegistryHive::CurrentUser, sandbox.keyPath + "\\Not\\There");
    std::string value = "untouched";
    EXPECT_FALSE(registry.ReadString("Language", value) || value != "untouched");
    // The first write creates the missing keys; later ones replace.
    registry.SetLanguage("German");
    registry.SetLanguage(" Ironvale \xC3\xA9 \\ \"quoted\" line\nnext\ttab ");
    registry.SetInstallDir(" C:\\Game \r\n");  // only the folder is trimmed
    registry.WriteString("Cut", std::string("before\0after", 12));
    registry.WriteString("Empty", "");
    EXPECT_EQ(registry.GetLanguage(), " Ironvale \xC3\xA9 \\ \"quoted\" line\nnext\ttab ");
    EXPECT_EQ(registry.GetInstallDir(), "C:\\Game");
    EXPECT_TRUE(registry.ReadString("Cut", value) && value == "before") << value;
    EXPECT_TRUE(registry.ReadString("Empty", value) && value.empty()) << value;
    EXPECT_FALSE(registry.ReadString("Missing", value));
    // Registry names ignore case, in key paths and value names alike.
    RegistryManager(RegistryHive::CurrentUser, sandbox.keyPath + "\\NOT\\there").WriteString("LANGUAGE", "Polish");
    EXPECT_EQ(registry.GetLanguage(), "Polish");
    EXPECT_EQ(RegistryManager(RegistryHive::LocalMachine, sandbox.keyPath + "\\Not\\There").GetLanguage(), "");

    // Windows allows 255 characters in a key name and 16383 in a value name.
    const std::pair<RegistryManager, std::string> failures[] = {
        {{RegistryHive::None, sandbox.keyPath}, "Language"},
        {{RegistryHive::CurrentUser, sandbox.keyPath + "\\" + std::string(300, 'k')}, "Language"},
        {{RegistryHive::CurrentUser, sandbox.keyPath}, std::string(16384, 'v')},
    };
    for (const auto& [place, valueName] : failures) {
        const std::string error = ErrorOf([&] { place.WriteString(valueName, "x"); });
        EXPECT_TRUE(EndsWith(error, " (8)")) << place.GetKeyPath() << ": " << error;
    }
}

TEST(InstallationData, NeedsBothVersionsDefaultsTheRestAndSavesWhatItReads) {
    TempFolder folder;
    for (const char* content :
         {"<I><CurrentVersion>1</CurrentVersion></I>", "<I><CurrentVersion /><PatcherVersion>3</PatcherVersion></I>",
          "<I><CurrentVersion>1</CurrentVersion><PatcherVersion>3</PatcherVersion>"}) {
        WriteTextFile(folder / "InstallationData.xml", content);
        EXPECT_THROW(InstallationData().Load(folder.Path()), Exception) << content;
    }
    // Runs of commas separate the digest list, which pairs up: a later pair wins and an odd last name goes.
    WriteTextFile(folder / "InstallationData.xml",
                  "<Any><PatcherVersion>3</PatcherVersion><CurrentVersion>1.2</CurrentVersion><Sku>Gold &amp; Co</Sku>"
                  "<InstalledHashes>,,a.dll,,1f,,b.dll,2e,a.dll,3d,lonely</InstalledHashes></Any>");
    const auto values = [](const InstallationData& d) {
        return std::vector<std::string>{d.currentVersion, d.patcherVersion, d.eulaVersion, d.pbEulaVersion, d.sku};
    };
    InstallationData data;
    data.Load(folder.Path());
    EXPECT_EQ(values(data), std::vector<std::string>({"1.2", "3", "0", "0", "Gold & Co"}));
    EXPECT_EQ(data.installedHashes, (std::map<std::string, std::string>{{"a.dll", "3d"}, {"b.dll", "2e"}}));

    // What is saved reads back the same.
    data.SetPatcherVersion(0.1f);
    EXPECT_EQ(data.patcherVersion, "0.1");  // as a default-formatted stream writes it
    data.currentVersion = "-1";
    data.eulaVersion = "2";
    data.pbEulaVersion = "1";
    ASSERT_TRUE(data.Save());
    InstallationData again;
    again.Load(folder.Path());
    EXPECT_EQ(values(again), std::vector<std::string>({"-1", "0.1", "2", "1", "Gold & Co"}));
    EXPECT_EQ(again.installedHashes, data.installedHashes);
}

TEST(SystemFacts, OsNamesFollowTheVersionTableAndSidsTheirTextForms) {
    const std::tuple<uint32_t, uint32_t, std::string> names[] = {
        {3, 3, "WindowsNT351"}, {3, 51, "UnknownVersion"}, {4, 10, "Windows98"},     {5, 1, "XP"},
        {6, 1, "Windows7"},     {6, 2, "UnknownVersion"},  {10, 0, "UnknownVersion"}};
    for (const auto& [major, minor, name] : names) EXPECT_EQ(OsNameForVersion(major, minor), name) << major << minor;
    OsInfo detected{true, "Server2003"};
    DetectOsName(detected);  // once: a filled record stays as it is
    EXPECT_EQ(detected.osName, "Server2003");
    // The authority in decimal (an unsigned number) unless one of its two high bytes is set: then in hexadecimal, two
    // digits a byte.
    EXPECT_EQ(FormatSid({0, 0, 0, 0, 0, 5}, {}), "S-1-5");
    EXPECT_EQ(FormatSid({0, 0, 0xFF, 0xFF, 0xFF, 0xFF}, {4294967295u, 7}), "S-1-4294967295-4294967295-7");
    EXPECT_EQ(FormatSid({0xAB, 0xCD, 0x0E, 0xF0, 0x01, 0x2F}, {2}), "S-1-0XABCD0EF0012F-2");
}

}  // namespace
