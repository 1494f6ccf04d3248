#include <windows.h>
// windows.h first: shlwapi.h needs its types.
#include <shlwapi.h>

#include "state/system_facts.h"

namespace {

// A token handle, closed on every way out.
class TokenHandle {
public:
    TokenHandle() = default;
    TokenHandle(const TokenHandle&) = delete;
    TokenHandle& operator=(const TokenHandle&) = delete;
    ~TokenHandle() {
        if (handle != nullptr) CloseHandle(handle);
    }
    HANDLE handle = nullptr;
};

bool IsMemberOfBuiltinGroup(DWORD alias) {
    SID_IDENTIFIER_AUTHORITY ntAuthority = SECURITY_NT_AUTHORITY;
    PSID group = nullptr;
    if (!AllocateAndInitializeSid(&ntAuthority, 2, SECURITY_BUILTIN_DOMAIN_RID, alias, 0, 0, 0, 0, 0, 0, &group)) {
        return false;
    }
    BOOL member = FALSE;
    const BOOL checked = CheckTokenMembership(nullptr, group, &member);
    FreeSid(group);
    return checked && member;
}

}  // namespace

bool IsUacEnabled() {
    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_LOCAL_MACHINE, "SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Policies\\System", 0, KEY_READ,
                      &key) != ERROR_SUCCESS) {
        return false;
    }
    DWORD value = 0;
    DWORD size = sizeof(value);
    const LONG result = RegQueryValueExA(key, "EnableLUA", nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size);
    RegCloseKey(key);
    return result == ERROR_SUCCESS && value != 0;
}

int32_t GetElevationType() {
    TokenHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token.handle)) return 0;
    TOKEN_ELEVATION_TYPE type = TokenElevationTypeDefault;
    DWORD size = 0;
    if (!GetTokenInformation(token.handle, TokenElevationType, &type, sizeof(type), &size)) return 0;
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
    TokenHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token.handle)) return false;
    DWORD size = 0;
    GetTokenInformation(token.handle, TokenUser, nullptr, 0, &size);
    if (size == 0) return false;
    std::vector<BYTE> buffer(size);
    if (!GetTokenInformation(token.handle, TokenUser, buffer.data(), size, &size)) return false;
    const PSID sid = reinterpret_cast<TOKEN_USER*>(buffer.data())->User.Sid;
    if (!IsValidSid(sid)) return false;
    const SID_IDENTIFIER_AUTHORITY* identifier = GetSidIdentifierAuthority(sid);
    for (size_t i = 0; i < authority.size(); ++i) authority[i] = identifier->Value[i];
    const UCHAR count = *GetSidSubAuthorityCount(sid);
    subAuthorities.clear();
    for (UCHAR i = 0; i < count; ++i) subAuthorities.push_back(*GetSidSubAuthority(sid, i));
    return true;
}
