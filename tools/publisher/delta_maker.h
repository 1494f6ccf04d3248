#pragma once

#include <string>

// Makes the VCDIFF delta that turns oldFile into newFile with the xdelta3
// program (no application header, no secondary compression: the form the
// updater decodes), then decodes it with the updater's own decoder into
// scratchFile and compares the result with newFile, so a delta the updater
// would rebuild wrongly is never shipped. Throws Exception when xdelta3
// cannot be run or fails, or when the check fails; scratchFile is removed.
void MakeCheckedDelta(const std::string& oldFile, const std::string& newFile, const std::string& deltaFile,
                      const std::string& scratchFile, const std::string& xdelta3 = "xdelta3");

// True when the xdelta3 program can be started.
bool IsXdelta3Available(const std::string& xdelta3 = "xdelta3");
