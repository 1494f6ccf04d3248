#pragma once

#include <string>

#include "base/local_time.h"

// One line of "UpdateHistory.log": date, time to the millisecond (numbers
// without leading zeros) and the location the patch came from, ended by
// CR LF. 7 March 2011 09:05:02.040 gives "2011-3-7 9:5:2.40 LOCATION".
std::string FormatHistoryLine(const LocalTime& time, const std::string& location);

// Appends the line for now to the installation's "UpdateHistory.log"
// (created when missing). A history that cannot be written is skipped.
void AppendUpdateHistory(const std::string& installDir, const std::string& location);
