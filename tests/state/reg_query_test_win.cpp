// A value written through RegistryManager, as the system's own reg.exe sees
// it in the real registry.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "registry_sandbox.h"
#include "state/registry_manager.h"

namespace {

std::string RunCommand(const std::string& command) {
    std::string output;
    FILE* pipe = _popen(command.c_str(), "r");
    if (pipe == nullptr) return output;
    char buffer[512];
    size_t got;
    while ((got = std::fread(buffer, 1, sizeof(buffer), pipe)) > 0) output.append(buffer, got);
    _pclose(pipe);
    return output;
}

TEST(RegistryRegQueryTest, RegExeReadsTheWrittenValue) {
    RegistrySandbox sandbox;
    const RegistryManager registry(RegistryHive::CurrentUser, sandbox.KeyPath());
    registry.SetLanguage("German");
    registry.SetInstallDir("C:\\Games\\Iron vale");
    const std::string output = RunCommand("reg.exe query \"HKCU\\" + sandbox.KeyPath() + "\" 2>&1");
    EXPECT_NE(output.find("Language    REG_SZ    German"), std::string::npos) << output;
    EXPECT_NE(output.find("Install Dir    REG_SZ    C:\\Games\\Iron vale"), std::string::npos) << output;

    // And the other way round: what reg.exe writes, the manager reads.
    RunCommand("reg.exe add \"HKCU\\" + sandbox.KeyPath() + "\" /v Language /t REG_SZ /d Polish /f 2>&1");
    EXPECT_EQ(registry.GetLanguage(), "Polish");
}

}  // namespace
