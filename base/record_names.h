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

// The files a batch's work folder holds besides its archives: the delta
// being applied (a worker's own with a suffix), the list of what stage one
// prepared, the description and its signature, and the folder where the
// downloader notes, for each archive it keeps between runs, what the
// archive must be and how to continue it.
extern const char* const kDeltaFileName;
extern const char* const kPreparedListName;
extern const char* const kDownloadRecordsFolderName;
const std::vector<std::string>& WorkFileNames();
// Whether an archive may be called name: a plain relative name that is
// none of the work files (nor a worker's delta).
bool IsUsableArchiveName(const std::string& name);
