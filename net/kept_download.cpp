#include "net/kept_download.h"

#include <map>
#include <vector>

#include "base/atomic_file.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "base/record_names.h"

namespace {

const size_t kLongestValidator = 200;
// A record is three short lines; anything longer is not one of ours.
const int64_t kLongestRecord = 512;

bool IsHeaderSafe(const std::string& text) {
    if (text.size() > kLongestValidator) return false;
    for (const char c : text) {
        if (c < 0x20 || c > 0x7E) return false;
    }
    return true;
}

// The record: the declared size and SHA-256 the file is kept for, then the
// server's validator, one a line.
std::string RecordHead(const DownloadEntry& entry) {
    return std::to_string(entry.declaredSize) + "\n" + entry.declaredSha256 + "\n";
}

// The validator of entry's record when the record is for what entry declares.
bool ReadRecord(const DownloadEntry& entry, std::string& validator) {
    std::string text;
    if (entry.recordPath.empty() || !ReadFileBytes(entry.recordPath, kLongestRecord, text)) return false;
    const std::string head = RecordHead(entry);
    if (text.size() <= head.size() || text.compare(0, head.size(), head) != 0 || text.back() != '\n') return false;
    validator = text.substr(head.size(), text.size() - head.size() - 1);
    return IsHeaderSafe(validator);
}

}  // namespace

KeptDownload::KeptDownload(const DownloadEntry& downloadEntry) : entry(downloadEntry) {
    allowed = !entry.recordPath.empty() && entry.declaredSize >= 0 && !entry.declaredSha256.empty();
    if (!allowed) return;
    length = GetFileLength(entry.localPath);
    // A part longer than the whole, or one without its record, cannot be
    // continued; a complete file needs no record, its check proves it.
    if (length > 0 && length < entry.declaredSize && ReadRecord(entry, validator)) offset = length;
}

bool KeptDownload::Begin(const std::string& newValidator) {
    offset = 0;
    validator = newValidator;
    if (!allowed) return false;
    allowed = MakeDirectories(GetParentDirectory(entry.recordPath)) &&
              ReplaceFileAtomically(entry.recordPath, RecordHead(entry) + validator + "\n");
    return allowed;
}

void KeptDownload::Forget() {
    // What stays without its record is never taken for a kept archive.
    DiscardFile(entry.localPath);
    if (!entry.recordPath.empty()) DiscardFile(entry.recordPath);
    length = -1;
    offset = 0;
    validator.clear();
}

void KeepDeclaredDownloads(std::list<DownloadEntry>& list, const std::string& folder) {
    const std::string records = PathJoin(folder, kDownloadRecordsFolderName);
    std::map<std::string, const DownloadEntry*> wanted;  // by name below folder
    for (DownloadEntry& entry : list) {
        const std::string name = PathBelow(entry.localPath, folder);
        if (name.empty() || entry.declaredSize < 0 || entry.declaredSha256.empty()) continue;
        entry.recordPath = PathJoin(records, name);
        wanted[name] = &entry;
    }
    std::vector<std::string> found;
    CollectFiles(records, found);
    for (const std::string& record : found) {
        // Names from the disk: only one that stays in the folder is acted on.
        const std::string name = PathBelow(record, records);
        if (!IsUsableArchiveName(name)) continue;
        const auto entry = wanted.find(name);
        std::string validator;
        if (entry != wanted.end() && ReadRecord(*entry->second, validator)) continue;
        DiscardFile(PathJoin(folder, name));
        DiscardFile(record);
    }
}

bool IsKeptDownload(const std::string& folder, const std::string& name) {
    return FileExists(PathJoin(PathJoin(folder, kDownloadRecordsFolderName), name));
}

std::string ChooseValidator(const std::string& etag, const std::string& lastModified) {
    // A weak ETag promises the same meaning, not the same bytes.
    const std::string& chosen = !etag.empty() && etag.compare(0, 2, "W/") != 0 ? etag : lastModified;
    return IsHeaderSafe(chosen) ? chosen : std::string();
}
