#include "app/failure_report.h"

#include "base/exception.h"
#include "text/localization.h"

namespace {

struct FailureRow {
    ErrorCode code;
    const char* logLine;
    LogLevel level;
    FailureNotice notice;
    const char* textKey;
    const char* secondKey;  // the next paragraph, if any (in a question, it replaces the connection advice)
    bool atEntryPoint;      // the entry point tells it in these words too
};

const FailureRow kFailures[] = {
    {ErrorCode::UserCancelled, "User cancelled:", LogLevel::Info, FailureNotice::None, nullptr, nullptr, false},
    {ErrorCode::PatchNotFound, "Patch not found.", LogLevel::Error, FailureNotice::PlayOldQuestion,
     "INSTALLER_ERROR_NO_PATCH_FOUND", nullptr, false},
    {ErrorCode::FileNotFound, "File not found.", LogLevel::Error, FailureNotice::PlayOldQuestion,
     "INSTALLER_ERROR_FILE_NOT_FOUND", nullptr, false},
    {ErrorCode::VersionUnconfirmed, "Latest version unconfirmed.", LogLevel::Error, FailureNotice::PlayOldQuestion,
     "INSTALLER_ERROR_LATEST_VERSION_UNCONFIRMED", "INSTALLER_ERROR_TRY_LATER", false},
    {ErrorCode::CorruptData, "Corrupt data.", LogLevel::Error, FailureNotice::ErrorBox, "INSTALLER_ERROR_CORRUPT_DATA",
     "INSTALLER_ERROR_REINSTALL", true},
    {ErrorCode::CorruptInstallation, "Corrupt installation.", LogLevel::Error, FailureNotice::ErrorBox,
     "INSTALLER_GAME_IS_NOT_INSTALLED", nullptr, true},
    {ErrorCode::SteamIncompatible, "Incompatible with Steam version.", LogLevel::Error, FailureNotice::ErrorBox,
     "INSTALLER_INCOMPATIBLE_WITH_STEAM", nullptr, true},
};

}  // namespace

FailureReport DescribeFailure(const Exception& error, FailureSite site) {
    FailureReport report;
    for (const FailureRow& row : kFailures) {
        if (row.code != error.Code() || (site == FailureSite::EntryPoint && !row.atEntryPoint)) continue;
        report.logLine = row.logLine;
        report.level = site == FailureSite::EntryPoint ? LogLevel::Error : row.level;
        report.notice = row.notice;
        // A cancel is only logged, with what was cancelled.
        if (row.notice == FailureNotice::None) report.logLine += error.message;
        if (row.textKey != nullptr) report.text = Localize(row.textKey);
        if (row.secondKey != nullptr) report.text += L"\n\n" + Localize(row.secondKey);
        if (row.notice == FailureNotice::PlayOldQuestion) {
            if (row.secondKey == nullptr) report.text += L"\n\n" + Localize("INSTALLER_ERROR_CONNECTION");
            report.text += L"\n\n" + Localize("INSTALLER_ERROR_PLAY_OLD_VERSION");
        }
        return report;
    }
    report.logLine = "Unknown exception type caught:" + error.message;
    report.level = site == FailureSite::EntryPoint ? LogLevel::Error : LogLevel::Fatal;
    report.text = Localize("INSTALLER_ERROR_OCCURRED") + L"\n" + error.wideMessage;
    return report;
}
