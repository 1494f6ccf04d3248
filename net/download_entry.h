#pragma once

#include <atomic>
#include <cstdint>
#include <list>
#include <string>
#include <utility>
#include <vector>

enum class DownloadStatus : int32_t {
    Pending = 0,      // not finished; also an HTTP transfer whose read failed part-way
    Done = 1,         // the whole file is at localPath
    Failed = 2,       // could not be fetched
    Cancelled = 3,    // a stop request ended the transfer
    NotFound = 4,     // the server answered 404
    Unsupported = 5,  // an absolute local path, which is not accepted as a location
    Corrupt = 6,      // arrived twice, and twice not as the publisher declared it (size or SHA-256)
};

// One file of a download list. The worker writes the status while the
// caller's thread polls it, hence the atomic.
struct DownloadEntry {
    DownloadEntry() = default;
    DownloadEntry(std::string sourceUrl, std::string destination)
        : url(std::move(sourceUrl)), localPath(std::move(destination)) {}
    DownloadEntry(const DownloadEntry& other)
        : url(other.url),
          localPath(other.localPath),
          declaredSize(other.declaredSize),
          declaredSha256(other.declaredSha256),
          sizeLimit(other.sizeLimit),
          recordPath(other.recordPath),
          status(other.status.load()) {}
    DownloadEntry& operator=(const DownloadEntry& other) {
        url = other.url;
        localPath = other.localPath;
        declaredSize = other.declaredSize;
        declaredSha256 = other.declaredSha256;
        sizeLimit = other.sizeLimit;
        recordPath = other.recordPath;
        status = other.status.load();
        return *this;
    }

    std::string url;
    std::string localPath;
    // What the publisher declared for the file, when it did: a transfer
    // that runs past the size stops (Failed); a file that arrives with
    // another size or SHA-256 is fetched once more, then given up (Corrupt).
    int64_t declaredSize = -1;   // -1: not declared
    std::string declaredSha256;  // 64 lower-case hexadecimal digits; empty: not declared
    // The most bytes the caller will take from a file nobody declared: a
    // larger one ends as Failed on every transport, and none of it stays.
    int64_t sizeLimit = -1;  // -1: no limit
    // The limit a transfer of this entry stops at: the declared size, else
    // sizeLimit (-1: none).
    int64_t TransferLimit() const { return declaredSize >= 0 ? declaredSize : sizeLimit; }
    // Where the downloader notes how to continue this file in a later run
    // (KeepDeclaredDownloads sets it). Empty: the file is never kept, and
    // nothing of a transfer that does not finish stays.
    std::string recordPath;
    std::atomic<DownloadStatus> status{DownloadStatus::Pending};
};

// One entry per name, in order: fetched from the location joined with the
// name (JoinLocation), saved in folder under the same name.
std::list<DownloadEntry> MakeDownloadList(const std::vector<std::string>& names, const std::string& location,
                                          const std::string& folder);
