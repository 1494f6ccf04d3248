#include <windows.h>
// windows.h first: shlwapi.h needs its types.
#include <shlwapi.h>

#include "base/unique_handle_win.h"
#include "state/system_facts.h"

namespace {

// A SID from AllocateAndInitializeSid.
struct SidTraits {
    using Value = PSID;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { FreeSid(value); }
};

bool IsMemberOfBuiltinGroup(DWORD alias) {
    SID_IDENTIFIER_AUTHORITY ntAuthority = SECURITY_NT_AUTHORITY;
    UniqueHandle<SidTraits> group;
    if (!AllocateAndInitializeSid(&ntAuthority, 2, SECURITY_BUILTIN_DOMAIN_RID, alias, 0, 0, 0, 0, 0, 0,
                                  group.Receive())) {
        return false;
    }
    BOOL member = FALSE;
    return CheckTokenMembership(nullptr, group.Get(), &member) && member;
}

}  // namespace

bool IsUacEnabled() {
    UniqueRegistryKey key;
    if (RegOpenKeyExA(HKEY_LOCAL_MACHINE, "SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Policies\\System", 0, KEY_READ,
                      key.Receive()) != ERROR_SUCCESS) {
        return false;
    }
    DWORD value = 0;
    DWORD size = sizeof(value);
    const LONG result =
        RegQueryValueExA(key.Get(), "EnableLUA", nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size);
    return result == ERROR_SUCCESS && value != 0;
}

int32_t GetElevationType() {
    UniqueKernelHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, token.Receive())) return 0;
    TOKEN_ELEVATION_TYPE type = TokenElevationTypeDefault;
    DWORD size = 0;
    if (!GetTokenInformation(token.Get(), TokenElevationType, &type, sizeof(type), &size)) return 0;
    return static_cast<int32_t>(type);
}

bool IsAdministrator() { return IsMemberOfBuiltinGroup(DOMAIN_ALIAS_RID_ADMINS); }

bool IsPowerUser() { return IsMemberOfBuiltinGroup(DOMAIN_ALIAS_RID_POWER_USERS); }

bool ReadOsVersion(uint32_t& major, uint32_t& minor) {
    OSVERSIONINFOA version = {};
    version.dwOSVersionInfoSize = sizeof(version);
    // The manifest's supported systems decide what this reports, which is
    // the version the program was written for.
#if defined(_MSC_VER)
#pragma warning(suppress : 4996)
#endif
    if (!GetVersionExA(&version)) return false;
    major = version.dwMajorVersion;
    minor = version.dwMinorVersion;
    return true;
}

bool ReadProcessOwnerSid(std::array<uint8_t, 6>& authority, std::vector<uint32_t>& subAuthorities) {
    UniqueKernelHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, token.Receive())) return false;
    DWORD size = 0;
    GetTokenInformation(token.Get(), TokenUser, nullptr, 0, &size);
    if (size == 0) return false;
    std::vector<BYTE> buffer(size);
    if (!GetTokenInformation(token.Get(), TokenUser, buffer.data(), size, &size)) return false;
    const PSID sid = reinterpret_cast<TOKEN_USER*>(buffer.data())->User.Sid;
    if (!IsValidSid(sid)) return false;
    const SID_IDENTIFIER_AUTHORITY* identifier = GetSidIdentifierAuthority(sid);
    for (size_t i = 0; i < authority.size(); ++i) authority[i] = identifier->Value[i];
    const UCHAR count = *GetSidSubAuthorityCount(sid);
    subAuthorities.clear();
    for (UCHAR i = 0; i < count; ++i) subAuthorities.push_back(*GetSidSubAuthority(sid, i));
    return true;
}
