#pragma once

#include <cstdint>
#include <list>
#include <string>

#include "net/download_entry.h"

// A file of a download list that may outlive the run: its entry declares
// its size and SHA-256 and names a record (recordPath). A file already
// complete is used again once its SHA-256 is checked; a partial one is
// continued from where it stopped, under the server validator the record
// keeps. Nothing kept is used unchecked: it passes the same check as a
// fresh download before anyone reads it.
class KeptDownload {
public:
    // What an earlier run left for entry, looked at once.
    explicit KeptDownload(const DownloadEntry& entry);

    // The entry may be kept at all.
    bool Allowed() const { return allowed; }
    // The whole declared size is there: to be checked, not fetched.
    bool Complete() const { return allowed && length == entry.declaredSize; }
    // The bytes an earlier transfer left to continue from; 0: from the start.
    int64_t Offset() const { return offset; }
    // The server's validator of those bytes (a strong ETag or a
    // Last-Modified date); may be empty.
    const std::string& Validator() const { return validator; }

    // A transfer starts at byte 0 under newValidator: the record says so
    // before the first byte lands. False when it cannot be written; the
    // file is then not kept.
    bool Begin(const std::string& newValidator);
    // The file and its record go: nothing of it is continued.
    void Forget();

private:
    const DownloadEntry& entry;
    bool allowed = false;
    int64_t length = -1;  // of the file on disk; -1: none
    int64_t offset = 0;
    std::string validator;
};

// Lets the files of list that declare their size and SHA-256 and are saved
// below folder survive the run, and removes every file an earlier run kept
// there that list does not want as it was recorded.
void KeepDeclaredDownloads(std::list<DownloadEntry>& list, const std::string& folder);

// True when the file name in folder is one the downloader keeps.
bool IsKeptDownload(const std::string& folder, const std::string& name);

// The validator of an answer as a request may carry it back (If-Range): a
// strong ETag, else the Last-Modified date; empty when neither is there or
// fit for a header line (printable ASCII, at most 200 characters).
std::string ChooseValidator(const std::string& etag, const std::string& lastModified);
