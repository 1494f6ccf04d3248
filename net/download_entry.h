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
};

// One file of a download list. The worker writes the status while the
// caller's thread polls it, hence the atomic.
struct DownloadEntry {
    DownloadEntry() = default;
    DownloadEntry(std::string sourceUrl, std::string destination)
        : url(std::move(sourceUrl)), localPath(std::move(destination)) {}
    DownloadEntry(const DownloadEntry& other)
        : url(other.url), localPath(other.localPath), status(other.status.load()) {}
    DownloadEntry& operator=(const DownloadEntry& other) {
        url = other.url;
        localPath = other.localPath;
        status = other.status.load();
        return *this;
    }

    std::string url;
    std::string localPath;
    std::atomic<DownloadStatus> status{DownloadStatus::Pending};
};

// One entry per name, in order: fetched from the location joined with the
// name (JoinLocation), saved in folder under the same name.
std::list<DownloadEntry> MakeDownloadList(const std::vector<std::string>& names, const std::string& location,
                                          const std::string& folder);
