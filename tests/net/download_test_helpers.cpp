#include "tests/net/download_test_helpers.h"

#include <cstdio>
#include <random>

#include "base/exception.h"
#include "base/log.h"
#include "base/log_file.h"
#include "base/paths.h"
#include "tests/support/test_files.h"

void RecordingView::OnFileProgress(const std::string& localPath, uint32_t bytesDone, uint32_t bytesTotal) {
    HttpDownloader* target = nullptr;
    {
        std::lock_guard<std::mutex> lock(mutex);
        reports.push_back(Report{localPath, bytesDone, bytesTotal});
        if (stopTarget != nullptr && bytesDone >= stopAt) std::swap(target, stopTarget);
    }
    changed.notify_all();
    if (target != nullptr) target->RequestStop();
}

void RecordingView::OnFileDone(const std::string& localPath) {
    std::lock_guard<std::mutex> lock(mutex);
    finished.push_back(localPath);
}

void RecordingView::StopAt(HttpDownloader& downloader, uint32_t minimumDone) {
    std::lock_guard<std::mutex> lock(mutex);
    stopTarget = &downloader;
    stopAt = minimumDone;
}

void RecordingView::WaitForBytes() {
    std::unique_lock<std::mutex> lock(mutex);
    changed.wait(lock, [this] {
        for (const Report& report : reports) {
            if (report.done > 0) return true;
        }
        return false;
    });
}

std::vector<RecordingView::Report> RecordingView::Reports() const {
    std::lock_guard<std::mutex> lock(mutex);
    return reports;
}

std::vector<std::string> RecordingView::Finished() const {
    std::lock_guard<std::mutex> lock(mutex);
    return finished;
}

CapturedLog::CapturedLog() {
    static int counter = 0;
    path = PathJoin(GetTempDirectory(), "ivl-net-test-" + std::to_string(std::random_device()()) + "-" +
                                            std::to_string(counter++) + ".log");
    Log::Close();
    LogFile::Open(path, true);
}

CapturedLog::~CapturedLog() {
    Log::Close();
    std::remove(path.c_str());
}

std::string CapturedLog::Text() {
    Log::Close();
    return PathExists(path) ? ReadTextFile(path) : std::string();
}

std::string ThrownMessage(const std::function<void()>& action) {
    try {
        action();
    } catch (const Exception& error) {
        return error.message;
    }
    return std::string();
}

std::string TestBytes(size_t count) {
    std::string bytes(count, '\0');
    for (size_t i = 0; i < count; ++i) bytes[i] = static_cast<char>((i * 7 + i / 256) & 0xFF);
    return bytes;
}

DownloadStatus FinalStatus(HttpDownloader& downloader) {
    downloader.WaitForWorker();
    return downloader.Entries().front().status;
}
