#include <windows.h>
// windows.h first: sddl.h needs its types.
#include <gtest/gtest.h>
#include <sddl.h>

#include <vector>

#include "state/system_facts.h"

namespace {

// The system's own conversion of the token's user SID.
std::string SystemSidText() {
    HANDLE token = nullptr;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token)) return "";
    DWORD size = 0;
    GetTokenInformation(token, TokenUser, nullptr, 0, &size);
    std::vector<BYTE> buffer(size);
    std::string text;
    char* converted = nullptr;
    if (GetTokenInformation(token, TokenUser, buffer.data(), size, &size) &&
        ConvertSidToStringSidA(reinterpret_cast<TOKEN_USER*>(buffer.data())->User.Sid, &converted)) {
        text = converted;
        LocalFree(converted);
    }
    CloseHandle(token);
    return text;
}

TEST(SystemFactsWinTest, OwnerSidMatchesTheSystemsConversion) {
    const std::string sid = GetProcessOwnerSid();
    EXPECT_EQ(sid.rfind("S-1-", 0), 0u) << sid;
    EXPECT_EQ(sid, SystemSidText());
}

TEST(SystemFactsWinTest, WineReportsWindows7ByDefault) {
    // Wine 8 presents itself as Windows 7 unless the prefix says otherwise.
    if (GetProcAddress(GetModuleHandleA("ntdll.dll"), "wine_get_version") == nullptr) GTEST_SKIP();
    OsInfo record;
    DetectOsName(record);
    EXPECT_EQ(record.osName, "Windows7");
}

}  // namespace
