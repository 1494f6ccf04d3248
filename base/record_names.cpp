#include "base/record_names.h"

#include "base/item_path.h"
#include "base/string_helpers.h"

const char* const kInstallationDataFileName = "InstallationData.xml";
const char* const kUninstallRecordName = "Uninstall.xml";
const char* const kProgressRecordName = "PPF.xml";
const char* const kSpareProgressRecordName = "_PPF.xml";
const char* const kDeltaFileName = "diffTempFile.dz";
const char* const kPreparedListName = "patchedfiles.lst";
const char* const kDownloadRecordsFolderName = "download-records";

const std::vector<std::string>& InstallationRecordNames() {
    static const std::vector<std::string> names{kInstallationDataFileName, kUninstallRecordName, kProgressRecordName,
                                                kSpareProgressRecordName};
    return names;
}

const std::vector<std::string>& WorkFileNames() {
    static const std::vector<std::string> names{kDeltaFileName, kPreparedListName, "patchinfo.xml", "patchinfo.xml.sig",
                                                kDownloadRecordsFolderName};
    return names;
}

bool IsUsableArchiveName(const std::string& name) {
    return IsSafeItemPath(name, WorkFileNames()) && !StartsWithIgnoringCase(name, kDeltaFileName);
}
