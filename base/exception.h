#pragma once

#include <cstdint>
#include <string>

// Categories that the top-level handlers tell apart. 11 is deliberately unused.
enum class ErrorCode : int32_t {
    None = 0,
    UserCancelled = 1,
    BuildNotFound = 2,
    ReinstallRequired = 3,
    NoLocalVersion = 4,
    PatchNotFound = 5,
    FileNotFound = 6,
    DeltaFailed = 7,
    RegistryFailed = 8,
    StepFailed = 9,
    NewerInstaller = 10,
    CorruptData = 12,
    CorruptInstallation = 13,
    SteamIncompatible = 14,
    PreparedFilesMissing = 15,  // stage one must run again before stage two may
    VersionUnconfirmed = 16,    // no valid signed statement names the latest version
};

// The program's one error type, thrown by value and caught by reference.
// The wide text is converted once, here, so handlers never convert.
class Exception {
public:
    explicit Exception(const std::string& message);
    Exception(const std::string& message, ErrorCode code);
    virtual ~Exception() = default;

    std::string message;       // system code page; goes to the log
    std::wstring wideMessage;  // shown to the user; empty if conversion failed
    int32_t code = 0;

    ErrorCode Code() const { return static_cast<ErrorCode>(code); }
};
