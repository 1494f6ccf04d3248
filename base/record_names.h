#pragma once

#include <string>
#include <vector>

// The names of the records the updater keeps in an installation folder.
// The patch engine protects them itself, whoever runs it: no item of a
// patch may name one or lie inside one.
extern const char* const kInstallationDataFileName;  // the installed version
extern const char* const kUninstallRecordName;       // what the uninstall removes
extern const char* const kProgressRecordName;        // stage two's write-ahead record
extern const char* const kSpareProgressRecordName;   // its replacement while it is written

// The four names above.
const std::vector<std::string>& InstallationRecordNames();

// The folder in a batch's work folder where the downloader notes, for each
// archive it keeps between runs, what the archive must be and how to
// continue it. No archive may be named into it.
extern const char* const kDownloadRecordsFolderName;
