#include "base/record_names.h"

const char* const kInstallationDataFileName = "InstallationData.xml";
const char* const kUninstallRecordName = "Uninstall.xml";
const char* const kProgressRecordName = "PPF.xml";
const char* const kSpareProgressRecordName = "_PPF.xml";
const char* const kDownloadRecordsFolderName = "download-records";

const std::vector<std::string>& InstallationRecordNames() {
    static const std::vector<std::string> names{kInstallationDataFileName, kUninstallRecordName, kProgressRecordName,
                                                kSpareProgressRecordName};
    return names;
}
