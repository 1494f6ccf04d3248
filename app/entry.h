#pragma once

#include <cstdint>
#include <string>

// Everything between process entry and exit: log, command line, single
// instance, the Updater run and the top-level error handler. commandLine
// excludes the program path. Returns the process exit code.
int32_t RunUpdaterProcess(const std::string& commandLine);

// The log file's name in the temporary folder.
extern const char* const kLogFileName;
