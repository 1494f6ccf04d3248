#include "net/http_downloader.h"

#include <chrono>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "net/file_copy.h"
#include "net/http_transfer.h"
#include "net/location.h"
#include "net/sha256.h"
#include "net/sign_url.h"

HttpDownloader::~HttpDownloader() {
    RequestStop();
    if (worker.joinable()) worker.join();
}

void HttpDownloader::Start(const std::list<DownloadEntry>& list, bool sign) {
    {
        std::unique_lock<std::mutex> lock(workerMutex);
        if (!workerEnded.wait_for(lock, std::chrono::milliseconds(100), [this] { return !workerRunning; })) {
            throw Exception("Downloader is busy.");
        }
    }
    if (list.empty()) throw Exception("No files to download.");
    if (worker.joinable()) worker.join();
    if (&list != &entries) entries = list;
    for (DownloadEntry& entry : entries) entry.status = DownloadStatus::Pending;
    signUrls = sign;
    stop.Reset();
    {
        std::lock_guard<std::mutex> lock(workerMutex);
        workerRunning = true;
    }
    worker = std::thread(&HttpDownloader::Run, this);
}

void HttpDownloader::Download(const std::string& url, const std::string& localPath, bool sign) {
    Start(std::list<DownloadEntry>{DownloadEntry(url, localPath)}, sign);
}

void HttpDownloader::RequestStop() {
    stop.Cancel();
    wakeEvent.Signal();
}

bool HttpDownloader::WorkerEnded() {
    std::lock_guard<std::mutex> lock(workerMutex);
    return !workerRunning;
}

bool HttpDownloader::WaitForWorker() {
    std::unique_lock<std::mutex> lock(workerMutex);
    if (!worker.joinable()) return false;
    workerEnded.wait(lock, [this] { return !workerRunning; });
    return true;
}

DownloadStatus HttpDownloader::WaitForFile(const std::string& fileName) {
    if (!worker.joinable()) throw Exception("HttpDownloader not started.");
    const DownloadEntry* wanted = nullptr;
    for (const DownloadEntry& entry : entries) {
        if (GetFileName(entry.localPath) == fileName) {
            wanted = &entry;
            break;
        }
    }
    const auto outcome = [wanted] { return wanted != nullptr ? wanted->status.load() : DownloadStatus::Pending; };
    for (;;) {
        const DownloadStatus status = outcome();
        if (status != DownloadStatus::Pending) return status;
        // A file the worker never reached because of a stop was cancelled,
        // not failed: the caller must not report a download error.
        if (stop.IsCancelled()) return DownloadStatus::Cancelled;
        if (WorkerEnded()) {
            // The entry may have been settled just before the worker ended.
            const DownloadStatus last = outcome();
            return last != DownloadStatus::Pending ? last : DownloadStatus::Failed;
        }
        // The worker signals after each file and once more after it has
        // ended; a stop request signals too.
        wakeEvent.Wait();
    }
}

ArchiveState HttpDownloader::WaitForArchive(const std::string& fileName) {
    switch (WaitForFile(fileName)) {
        case DownloadStatus::Done:
            return ArchiveState::Arrived;
        case DownloadStatus::Cancelled:
            return ArchiveState::Cancelled;
        case DownloadStatus::Corrupt:
            return ArchiveState::Corrupt;
        default:
            return ArchiveState::Failed;
    }
}

void HttpDownloader::Run() {
    for (DownloadEntry& entry : entries) {
        if (stop.IsCancelled()) break;
        entry.status = FetchChecked(entry);
        wakeEvent.Signal();
        if (entry.status != DownloadStatus::Done) break;
    }
    {
        std::lock_guard<std::mutex> lock(workerMutex);
        workerRunning = false;
    }
    workerEnded.notify_all();
    wakeEvent.Signal();
}

DownloadStatus HttpDownloader::FetchChecked(DownloadEntry& entry) {
    const std::string source = entry.url;  // a relative one is resolved by the first fetch
    DownloadStatus status = Fetch(entry);
    if (status != DownloadStatus::Done) return status;
    status = Check(entry);
    if (status != DownloadStatus::Corrupt) return status;
    // Damaged on the way (a flaky proxy, a cache holding a cut-off copy):
    // one more try from the source, then the file is given up.
    LOG(Error) << "Fetching " << source << " once more.";
    entry.url = source;
    status = Fetch(entry);
    if (status == DownloadStatus::Done) status = Check(entry);
    return status;
}

DownloadStatus HttpDownloader::Fetch(DownloadEntry& entry) {
    LOG(Trace) << "Downloading file: " << entry.url;
    switch (ClassifyLocation(entry.url)) {
        case LocationKind::Http:
            return HttpTransfer(signUrls ? SignUrl(entry.url) : entry.url, entry.localPath, entry.TransferLimit(), stop,
                                statusView);
        case LocationKind::Relative:
            entry.url = PathJoin(GetProgramFolder(), entry.url);
            return FileCopyTransfer(entry.url, entry.localPath, entry.TransferLimit(), stop, statusView);
        case LocationKind::FileCopy:
            return FileCopyTransfer(entry.url, entry.localPath, entry.TransferLimit(), stop, statusView);
        case LocationKind::Unsupported:
            break;
    }
    LOG(Error) << "Download error, protocol not supported. URL: " << entry.url;
    return DownloadStatus::Unsupported;
}

DownloadStatus HttpDownloader::Check(const DownloadEntry& entry) {
    if (entry.declaredSize < 0 && entry.declaredSha256.empty()) return DownloadStatus::Done;
    Sha256Digest digest{};
    int64_t length = 0;
    const bool hashed = Sha256OfFile(entry.localPath, digest, length, &stop);
    DownloadStatus status = DownloadStatus::Corrupt;
    if (stop.IsCancelled()) {
        status = DownloadStatus::Cancelled;
    } else if (!hashed) {
        LOG(Error) << "Cannot read " << entry.localPath << " to check it.";
    } else if (entry.declaredSize >= 0 && length != entry.declaredSize) {
        LOG(Error) << entry.url << " arrived with " << length << " bytes, not the declared " << entry.declaredSize
                   << ".";
    } else if (!entry.declaredSha256.empty() && HexDigits(digest.data(), digest.size()) != entry.declaredSha256) {
        LOG(Error) << entry.url << " arrived with the SHA-256 " << HexDigits(digest.data(), digest.size())
                   << ", not the declared " << entry.declaredSha256 << ".";
    } else {
        status = DownloadStatus::Done;
    }
    // Only a file that matches stays: nothing may take a damaged one for
    // the real thing.
    if (status != DownloadStatus::Done) RemoveFile(entry.localPath);
    return status;
}
