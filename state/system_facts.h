#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "base/file_operations.h"  // FileExists

// Facts about the machine, the user's rights and the operating system that
// the environment checks rest on.

// The operating system's name as the configuration lists supported ones,
// detected once per process.
struct OsInfo {
    bool detected = false;
    std::string osName;
};

// User Account Control is switched on ("EnableLUA" not 0).
bool IsUacEnabled();
// The process token's elevation type: 1 default, 2 full, 3 limited; 0 when
// it cannot be read.
int32_t GetElevationType();
// Membership of the calling thread's token in the administrators or the
// power users group. A token filtered by UAC is no administrator.
bool IsAdministrator();
bool IsPowerUser();

// Fills record once: later calls leave it alone.
void DetectOsName(OsInfo& record);
// The name for a version, "UnknownVersion" for one the table does not know.
std::string OsNameForVersion(uint32_t major, uint32_t minor);
bool IsWindows7(const std::string& osName);

// The current process's user SID in text form ("S-1-5-21-..."), empty when
// it cannot be read.
std::string GetProcessOwnerSid();
// The text form of a SID from its parts: "S-1-", the authority (decimal
// when its two high bytes are zero, else "0X" and twelve hex digits), then
// each sub-authority in decimal.
std::string FormatSid(const std::array<uint8_t, 6>& authority, const std::vector<uint32_t>& subAuthorities);

// Platform queries behind the functions above.
// The version numbers, false when the platform has none.
bool ReadOsVersion(uint32_t& major, uint32_t& minor);
// The parts of the process owner's SID, false when they cannot be read.
bool ReadProcessOwnerSid(std::array<uint8_t, 6>& authority, std::vector<uint32_t>& subAuthorities);
