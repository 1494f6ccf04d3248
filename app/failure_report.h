#pragma once

#include <string>

#include "base/log.h"

class Exception;

// Where a failure that ends the run is caught: the update's own handler,
// or the entry point for what escaped the run (the Steam check).
enum class FailureSite { UpdateRun, EntryPoint };

// What the player is shown.
enum class FailureNotice {
    None,             // a cancel needs no box
    ErrorBox,         // text in an error box
    PlayOldQuestion,  // text asking whether to play the installed version
};

// How one failure is told: a log line with its level, and what the player
// sees.
struct FailureReport {
    std::string logLine;
    LogLevel level = LogLevel::Error;
    FailureNotice notice = FailureNotice::ErrorBox;
    std::wstring text;
};

// The one table from an Exception's ErrorCode to its report. The entry
// point tells only the codes that can escape the run in their own words
// (and every line at Error level); everything else is "Unknown exception
// type caught:" with the exception's own text.
FailureReport DescribeFailure(const Exception& error, FailureSite site);
