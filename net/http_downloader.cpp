#include "net/http_downloader.h"

#include <algorithm>
#include <chrono>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "net/file_copy.h"
#include "net/http_transfer.h"
#include "net/kept_download.h"
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
    // What an earlier run completed is handed over first: work on it starts
    // before the missing files arrive.
    for (DownloadEntry& entry : entries) {
        if (stop.IsCancelled()) break;
        if (!TakeKept(entry)) continue;
        entry.status = DownloadStatus::Done;
        wakeEvent.Signal();
    }
    for (DownloadEntry& entry : entries) {
        if (stop.IsCancelled()) break;
        if (entry.status == DownloadStatus::Done) continue;
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

bool HttpDownloader::TakeKept(const DownloadEntry& entry) {
    KeptDownload kept(entry);
    if (!kept.Complete()) return false;
    if (Check(entry) != DownloadStatus::Done) {
        if (!stop.IsCancelled()) kept.Forget();
        return false;
    }
    LOG(Info) << "Taking " << entry.localPath << " as an earlier run left it.";
    const auto size = static_cast<uint64_t>(entry.declaredSize);
    ReportFileProgress(statusView, entry.localPath, size, size);
    if (statusView != nullptr) statusView->OnFileDone(entry.localPath);
    return true;
}

DownloadStatus HttpDownloader::FetchChecked(DownloadEntry& entry) {
    const std::string source = entry.url;  // a relative one is resolved by the first fetch
    DownloadStatus status = FetchPatiently(entry);
    if (status != DownloadStatus::Done) return status;
    status = Check(entry);
    if (status != DownloadStatus::Corrupt) return status;
    // Damaged on the way (a flaky proxy, a cache holding a cut-off copy, a
    // part kept from a file that has changed since): one more try from the
    // source, from its start, then the file is given up.
    LOG(Error) << "Fetching " << source << " once more.";
    entry.url = source;
    status = FetchPatiently(entry);
    if (status == DownloadStatus::Done) status = Check(entry);
    return status;
}

DownloadStatus HttpDownloader::FetchPatiently(DownloadEntry& entry) {
    const std::string source = entry.url;
    uint64_t furthest = 0;  // of any try
    int idle = 0;           // tries in a row that got no further
    for (;;) {
        entry.url = source;
        const TransferResult result = Fetch(entry);
        idle = result.arrived > furthest ? 0 : idle + 1;
        furthest = std::max(furthest, result.arrived);
        const bool retry = result.interrupted && furthest > 0 && idle < retryPolicy.attempts && !stop.IsCancelled();
        if (retry) {
            const auto pause = retryPolicy.firstPause * (1 << std::min(idle, 10));
            LOG(Error) << "The transfer of " << entry.url << " broke off; trying again in " << pause.count() << " ms.";
            if (statusView != nullptr) statusView->OnFileRetrying(entry.localPath);
            if (Pause(pause)) continue;
        }
        // The view hears of the file once, however many tries it took.
        if (result.reported && statusView != nullptr) statusView->OnFileDone(entry.localPath);
        return retry ? DownloadStatus::Cancelled : result.status;
    }
}

bool HttpDownloader::Pause(std::chrono::milliseconds pause) {
    const auto end = std::chrono::steady_clock::now() + pause;
    while (!stop.IsCancelled() && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return !stop.IsCancelled();
}

TransferResult HttpDownloader::Fetch(DownloadEntry& entry) {
    LOG(Trace) << "Downloading file: " << entry.url;
    KeptDownload kept(entry);
    const TransferContext context{stop, statusView, retryPolicy.stallTimeout};
    switch (ClassifyLocation(entry.url)) {
        case LocationKind::Http:
            return HttpTransfer(signUrls ? SignUrl(entry.url) : entry.url, entry, kept, context);
        case LocationKind::Relative:
            entry.url = PathJoin(GetProgramFolder(), entry.url);
            return FileCopyTransfer(entry, kept, context);
        case LocationKind::FileCopy:
            return FileCopyTransfer(entry, kept, context);
        case LocationKind::Unsupported:
            break;
    }
    LOG(Error) << "Download error, protocol not supported. URL: " << entry.url;
    return TransferResult{DownloadStatus::Unsupported};
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
    // the real thing. One that may be kept stays when a stop cut its check
    // short.
    if (status == DownloadStatus::Corrupt || (status != DownloadStatus::Done && entry.recordPath.empty())) {
        DiscardFile(entry.localPath);
    }
    return status;
}
