#include <windows.h>

#include <gtest/gtest.h>

#include <string>

#include "resources/resource_ids.h"

namespace {

// Test programs link the same resource object as IronvaleUpdater.exe, so the
// program's icon, manifest and version block can be checked from here.
TEST(ProgramResourcesTest, IconManifestVersionAndStringTable) {
    EXPECT_NE(FindResourceA(nullptr, MAKEINTRESOURCEA(IDI_IRONVALE), MAKEINTRESOURCEA(14) /* RT_GROUP_ICON */),
              nullptr);
    HRSRC manifest = FindResourceA(nullptr, MAKEINTRESOURCEA(1), MAKEINTRESOURCEA(24) /* RT_MANIFEST */);
    ASSERT_NE(manifest, nullptr);
    const char* text = static_cast<const char*>(LockResource(LoadResource(nullptr, manifest)));
    const std::string body(text, SizeofResource(nullptr, manifest));
    EXPECT_NE(body.find("level=\"asInvoker\""), std::string::npos);
    EXPECT_NE(body.find("Microsoft.Windows.Common-Controls"), std::string::npos);
    EXPECT_NE(FindResourceA(nullptr, MAKEINTRESOURCEA(1), MAKEINTRESOURCEA(16) /* RT_VERSION */), nullptr);
    EXPECT_NE(FindResourceA(nullptr, "IDS_STRINGS", "CSV"), nullptr);
}

}  // namespace
