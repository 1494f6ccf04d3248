#include "patch/patch_progress_file.h"

#include <cerrno>
#include <climits>
#include <cstdlib>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/xml_file.h"

namespace {

const char kLoadFailure[] = "Failed to load PatchProgressFile file.";

// The whole attribute must be a decimal number that fits: "12abc" is as
// unreadable as "abc".
bool ParseActionIndex(const char* text, int32_t& value) {
    if (text == nullptr || *text == '\0') return false;
    char* end = nullptr;
    errno = 0;
    const long number = std::strtol(text, &end, 10);
    if (errno != 0 || *end != '\0' || number < INT32_MIN || number > INT32_MAX) return false;
    value = static_cast<int32_t>(number);
    return true;
}

// An element whose text is empty is printed as <X></X> and reads back with
// no text node; that, like a missing element, is an empty value.
std::string TextOrEmpty(const TiXmlElement* root, const char* name) {
    std::string text;
    ReadElementText(root, name, text);
    return text;
}

}  // namespace

void PatchProgressFile::SetDirectory(const std::string& directory) {
    folder = directory;
    recordPath = PathJoin(folder, kProgressRecordName);
    alternativeRecordPath = PathJoin(folder, kSpareProgressRecordName);
}

void PatchProgressFile::LoadRecord(const std::string& path) {
    TiXmlDocument document;
    if (!LoadXmlFile(path, document)) throw Exception(kLoadFailure);
    const TiXmlElement* root = document.RootElement();
    const TiXmlElement* status = root->FirstChildElement("PatchStatus");
    int32_t action = -1;
    if (status == nullptr || !ParseActionIndex(status->Attribute("action"), action)) throw Exception(kLoadFailure);
    const char* statusFile = status->Attribute("file");

    patchPath = TextOrEmpty(root, "PatchPath");
    patchedFilesPath = TextOrEmpty(root, "PatchedFilesPath");
    patchUri = TextOrEmpty(root, "PatchURI");
    actionIndex = action;
    file = statusFile == nullptr ? std::string() : std::string(statusFile);
    version = TextOrEmpty(root, "Version");
}

bool PatchProgressFile::TryLoad(const std::string& path) {
    try {
        LoadRecord(path);
        return true;
    } catch (const Exception&) {
        return false;
    }
}

bool PatchProgressFile::Recover() {
    const bool recordExists = FileExists(recordPath);
    const bool alternativeExists = FileExists(alternativeRecordPath);
    const Exception unrecoverable("Unrecoverable interrupted batch, reinstall necessary.",
                                  ErrorCode::ReinstallRequired);
    if (recordExists) {
        if (TryLoad(recordPath)) {
            // A "_PPF.xml" beside a readable record is a write that did not
            // reach its rename: the record it would have replaced is older
            // but names an action that is safe to repeat.
            // One that cannot go is replaced by the next record written.
            if (alternativeExists) DiscardFile(alternativeRecordPath);
            return true;
        }
        LOG(Error) << "Unreadable patch progress record: " << recordPath;
        DiscardFile(recordPath);
        if (!alternativeExists) throw unrecoverable;
    }
    if (alternativeExists) {
        if (!TryLoad(alternativeRecordPath)) {
            LOG(Error) << "Unreadable patch progress record: " << alternativeRecordPath;
            DiscardFile(alternativeRecordPath);
            throw unrecoverable;
        }
        // Loaded either way; a spare left where it is (the unreadable record
        // would not go) is replaced by stage two's next record.
        static_cast<void>(RenameFile(alternativeRecordPath, recordPath));
        return true;
    }
    return false;
}

bool PatchProgressFile::WriteRecord() {
    TiXmlDocument document;
    StartXmlDocument(document);
    TiXmlNode* root = document.InsertEndChild(TiXmlElement("WestPatchStatus"));
    AppendTextElement(root, "PatchPath", patchPath);
    AppendTextElement(root, "PatchedFilesPath", patchedFilesPath);
    AppendTextElement(root, "PatchURI", patchUri);
    TiXmlElement status("PatchStatus");
    status.SetAttribute("action", actionIndex);
    status.SetAttribute("file", file);
    root->InsertEndChild(status);
    AppendTextElement(root, "Version", version);
    return SaveXmlFile(document, recordPath, alternativeRecordPath);
}
