#include <windows.h>

#include <gtest/gtest.h>

#include <string>

#include "resources/resource_ids.h"

// Test programs link the same resource object as IronvaleUpdater.exe: its icon, manifest (no elevation prompt, modern
// controls), version block and string table (read by the string table test).
TEST(ProgramResourcesTest, IconManifestAndVersion) {
    EXPECT_NE(FindResourceA(nullptr, MAKEINTRESOURCEA(IDI_IRONVALE), MAKEINTRESOURCEA(14) /* RT_GROUP_ICON */),
              nullptr);
    EXPECT_NE(FindResourceA(nullptr, MAKEINTRESOURCEA(1), MAKEINTRESOURCEA(16) /* RT_VERSION */), nullptr);
    HRSRC manifest = FindResourceA(nullptr, MAKEINTRESOURCEA(1), MAKEINTRESOURCEA(24) /* RT_MANIFEST */);
    ASSERT_NE(manifest, nullptr);
    const std::string body(static_cast<const char*>(LockResource(LoadResource(nullptr, manifest))),
                           SizeofResource(nullptr, manifest));
    EXPECT_NE(body.find("level=\"asInvoker\""), std::string::npos);
    EXPECT_NE(body.find("Microsoft.Windows.Common-Controls"), std::string::npos);
}
