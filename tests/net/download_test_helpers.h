#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <mutex>
#include <string>
#include <vector>

#include "base/status_interfaces.h"
#include "net/http_downloader.h"

// Records what the downloader reports, from its worker thread, and can ask
// the downloader to stop once a transfer has got going.
class RecordingView final : public IStatusView {
public:
    struct Report {
        std::string localPath;
        uint32_t done;
        uint32_t total;
    };

    void OnApplyProgress(const std::string&, int32_t) override {}
    void OnFileProgress(const std::string& localPath, uint32_t bytesDone, uint32_t bytesTotal) override;
    void OnFileDone(const std::string& localPath) override;

    // Requests a stop of downloader from inside the first report (with
    // minimumDone bytes or more).
    void StopAt(HttpDownloader& downloader, uint32_t minimumDone);
    // Blocks until a report with at least one byte done has come.
    void WaitForBytes();

    std::vector<Report> Reports() const;
    std::vector<std::string> Finished() const;

private:
    mutable std::mutex mutex;
    std::condition_variable changed;
    std::vector<Report> reports;
    std::vector<std::string> finished;
    HttpDownloader* stopTarget = nullptr;
    uint32_t stopAt = 0;
};

// Log lines written while the object lives, in a file of its own.
class CapturedLog {
public:
    CapturedLog();
    CapturedLog(const CapturedLog&) = delete;
    CapturedLog& operator=(const CapturedLog&) = delete;
    ~CapturedLog();
    // Ends the capture and returns the text.
    std::string Text();

private:
    std::string path;
};

// The text of the Exception that action throws; empty when it throws none.
std::string ThrownMessage(const std::function<void()>& action);
// count bytes of every value (zeros included), in a fixed order.
std::string TestBytes(size_t count);
// Outcome of the single entry of a Download once its worker has ended.
DownloadStatus FinalStatus(HttpDownloader& downloader);

// Location forms the platform spells differently.
// The UNC form of an absolute local path.
std::string UncFormOf(const std::string& absolutePath);
// An absolute local path that the downloader must refuse.
std::string AbsoluteLocation();
// Whether the platform's file copy calls back with progress (and so can be
// cancelled part-way).
bool PlatformCopyReportsProgress();
