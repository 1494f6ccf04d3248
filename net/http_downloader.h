#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <list>
#include <mutex>
#include <string>
#include <thread>

#include "base/archive_source.h"
#include "base/cancellation.h"
#include "base/status_interfaces.h"
#include "net/auto_reset_event.h"
#include "net/download_entry.h"
#include "net/transfer.h"

// How a transfer that breaks off is tried again: after a pause that
// doubles with each try that brings nothing, continuing from what arrived.
// Only a file that has sent bytes in this run is tried again, so a server
// that cannot be reached at all fails at once.
struct RetryPolicy {
    int attempts = 5;  // tries in a row that may bring nothing before the file is given up
    std::chrono::milliseconds firstPause{1000};
    std::chrono::seconds stallTimeout{30};  // a transfer without a byte this long breaks off
};

// Fetches an ordered list of files on a worker thread of its own, so the
// caller can work on each file as soon as it has arrived. A location is an
// "http://" address, a "file://" address, a UNC path or a path relative to
// the program's folder. The first file that does not arrive ends the list.
// A file is reported only once it is checked against what its entry
// declares (size, SHA-256). Files an earlier run kept (KeepDeclaredDownloads)
// are checked and handed over before anything is fetched, and a partial one
// is continued.
class HttpDownloader : public IArchiveSource {
public:
    // A cancel of runCancel (may be null) stops the downloader too, and
    // keeps it stopped for every later Start.
    explicit HttpDownloader(const CancellationToken* runCancel = nullptr) : stop(runCancel) {}
    HttpDownloader(const HttpDownloader&) = delete;
    HttpDownloader& operator=(const HttpDownloader&) = delete;
    // Stops the worker and waits for it.
    virtual ~HttpDownloader();

    // Fetches list (every status reset to Pending) on a new worker; with
    // signUrls set, HTTP addresses are signed. Throws "Downloader is busy."
    // when the previous worker is still running after 100 ms and "No files
    // to download." for an empty list.
    void Start(const std::list<DownloadEntry>& list, bool signUrls);
    // Start with a list of one.
    void Download(const std::string& url, const std::string& localPath, bool signUrls);

    // Blocks until the first entry whose local file name equals fileName
    // (exactly) has an outcome, the worker has ended, or a stop was
    // requested. A name the list does not hold gives Failed once the worker
    // has ended; a stop gives Cancelled. Throws "HttpDownloader not started."
    // before the first Start.
    DownloadStatus WaitForFile(const std::string& fileName);
    // WaitForFile as the patch applier sees it.
    ArchiveState WaitForArchive(const std::string& fileName) override;
    void Abandon() override { RequestStop(); }

    // Ends the transfer in progress and the rest of the list, and wakes a
    // caller blocked in WaitForFile. Safe from any thread.
    void RequestStop();

    // Blocks until the worker of the last Start has ended; false when none
    // was ever started. Read the outcomes from Entries() afterwards.
    bool WaitForWorker();
    // The list of the last Start with the worker's outcomes. The statuses
    // may be read at any time; the rest only once the worker has ended.
    const std::list<DownloadEntry>& Entries() const { return entries; }

    // Receives progress from the worker thread; not owned, may be null.
    // Set it before Start.
    void SetStatusView(IStatusView* view) { statusView = view; }
    // Set it before Start.
    void SetRetryPolicy(const RetryPolicy& policy) { retryPolicy = policy; }

private:
    void Run();
    // True when an earlier run left the entry's file complete and it
    // passes the check.
    bool TakeKept(const DownloadEntry& entry);
    // The entry's final outcome: fetched, checked, and fetched once more
    // when it does not match its declaration.
    DownloadStatus FetchChecked(DownloadEntry& entry);
    // Fetches, and tries again as the retry policy allows.
    DownloadStatus FetchPatiently(DownloadEntry& entry);
    TransferResult Fetch(DownloadEntry& entry);
    // Done when the file at the entry's path matches what the entry
    // declares, Corrupt when it does not, Cancelled on a stop.
    DownloadStatus Check(const DownloadEntry& entry);
    // Waits unless a stop comes first; false on a stop.
    bool Pause(std::chrono::milliseconds pause);
    bool WorkerEnded();

    bool signUrls = false;
    CancellationToken stop;
    std::thread worker;
    AutoResetEvent wakeEvent;
    std::list<DownloadEntry> entries;
    IStatusView* statusView = nullptr;
    RetryPolicy retryPolicy;

    // Whether the worker of the last Start is still running.
    std::mutex workerMutex;
    std::condition_variable workerEnded;
    bool workerRunning = false;
};
