#pragma once

#include <cstdint>
#include <string>

// Everything between process entry and exit: log, command line, single
// instance, the Updater run and the top-level error handler. commandLine
// excludes the program path; updateLocation is the program's built-in
// location of its patches (empty: beside the program). Returns the process
// exit code.
int32_t RunUpdaterProcess(const std::string& commandLine, const std::string& updateLocation);

// The built-in location of this build's patches, set by the publisher at
// build time (CMake option IRONVALE_UPDATE_LOCATION); empty by default.
extern const char* const kBuiltInUpdateLocation;

// The log file's name in the temporary folder.
extern const char* const kLogFileName;
