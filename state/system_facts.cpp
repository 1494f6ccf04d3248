#include "state/system_facts.h"

namespace {

const char* const kUnknownVersion = "UnknownVersion";

struct VersionName {
    uint32_t major;
    uint32_t minor;
    const char* name;
};

const VersionName kVersionNames[] = {
    {3, 3, "WindowsNT351"}, {4, 0, "Windows95"},  {4, 10, "Windows98"}, {4, 90, "WindowsME"}, {5, 0, "Windows2000"},
    {5, 1, "XP"},           {5, 2, "Server2003"}, {6, 0, "Vista"},      {6, 1, "Windows7"},
};

}  // namespace

std::string OsNameForVersion(uint32_t major, uint32_t minor) {
    for (const VersionName& row : kVersionNames) {
        if (row.major == major && row.minor == minor) return row.name;
    }
    return kUnknownVersion;
}

void DetectOsName(OsInfo& record) {
    if (record.detected) return;
    uint32_t major = 0;
    uint32_t minor = 0;
    record.osName = ReadOsVersion(major, minor) ? OsNameForVersion(major, minor) : kUnknownVersion;
    record.detected = true;
}

bool IsWindows7(const std::string& osName) { return osName == "Windows7"; }

std::string FormatSid(const std::array<uint8_t, 6>& authority, const std::vector<uint32_t>& subAuthorities) {
    std::string text = "S-1-";
    if (authority[0] == 0 && authority[1] == 0) {
        const uint32_t value = (static_cast<uint32_t>(authority[2]) << 24) |
                               (static_cast<uint32_t>(authority[3]) << 16) |
                               (static_cast<uint32_t>(authority[4]) << 8) | authority[5];
        text += std::to_string(value);
    } else {
        const char* const digits = "0123456789ABCDEF";
        text += "0X";
        for (const uint8_t byte : authority) {
            text += digits[byte >> 4];
            text += digits[byte & 0xF];
        }
    }
    for (const uint32_t part : subAuthorities) text += "-" + std::to_string(part);
    return text;
}

std::string GetProcessOwnerSid() {
    std::array<uint8_t, 6> authority{};
    std::vector<uint32_t> subAuthorities;
    if (!ReadProcessOwnerSid(authority, subAuthorities)) return std::string();
    return FormatSid(authority, subAuthorities);
}
