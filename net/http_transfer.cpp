#include "net/http_transfer.h"

#include <cstdio>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "net/http_transport.h"

namespace {

// Progress of a server that sends no length is measured against this.
const uint32_t kAssumedLength = 1048576;

class FileSink final : public HttpResponseSink {
public:
    FileSink(const std::string& path, int64_t limit, const CancellationToken& stop, IStatusView* view)
        : localPath(path), sizeLimit(limit), stopRequested(stop), statusView(view) {}

    bool OnResponse(const std::string& statusText, bool lengthKnown, uint32_t contentLength) override {
        // A status that cannot be read is taken as success.
        if (statusText == "404") {
            refusal = DownloadStatus::NotFound;
            return false;
        }
        if (!statusText.empty() && statusText != "200") return false;
        if (lengthKnown && RunsPastLimit(contentLength)) return false;
        hasLength = lengthKnown;
        expected = lengthKnown ? contentLength : kAssumedLength;
        try {
            file.Create(localPath);
        } catch (const Exception&) {
            return false;
        }
        Report();
        return true;
    }

    bool KeepReading() override { return !stopRequested.IsCancelled(); }

    bool OnData(const char* data, uint32_t size) override {
        // Not one byte past what the publisher declared reaches the disk.
        if (RunsPastLimit(received + size)) return false;
        received += size;
        Report();
        try {
            file.Write(data, size);
        } catch (const Exception&) {
            return false;
        }
        return true;
    }

    bool FileOpened() const { return file.IsOpen(); }
    // True when the body fell short of (or ran past) the length the server announced.
    bool BodyIncomplete() const { return hasLength && received != expected; }
    DownloadStatus Refusal() const { return refusal; }
    void CloseFile() { file.Close(); }

private:
    bool RunsPastLimit(uint64_t length) const {
        if (sizeLimit < 0 || length <= static_cast<uint64_t>(sizeLimit)) return false;
        LOG(Error) << "The transfer to " << localPath << " runs past the declared " << sizeLimit << " bytes.";
        return true;
    }

    void Report() {
        if (statusView != nullptr) {
            statusView->OnFileProgress(localPath, static_cast<uint32_t>(received), expected);
        }
    }

    const std::string& localPath;
    const int64_t sizeLimit;
    const CancellationToken& stopRequested;
    IStatusView* statusView;
    FileStream file;
    bool hasLength = false;
    uint32_t expected = 0;
    uint64_t received = 0;
    DownloadStatus refusal = DownloadStatus::Failed;
};

}  // namespace

DownloadStatus HttpTransfer(const std::string& address, const std::string& localPath, int64_t sizeLimit,
                            const CancellationToken& stop, IStatusView* statusView) {
    FileSink sink(localPath, sizeLimit, stop, statusView);
    DownloadStatus status = DownloadStatus::Failed;
    switch (HttpGet(address, sink)) {
        case HttpOutcome::NoSession:
        case HttpOutcome::NoResponse:
            status = DownloadStatus::Failed;
            break;
        case HttpOutcome::Abandoned:
            status = sink.Refusal();
            break;
        case HttpOutcome::Stopped:
            status = DownloadStatus::Cancelled;
            break;
        case HttpOutcome::ReadFailed:
            status = DownloadStatus::Pending;
            break;
        case HttpOutcome::Complete:
            // A connection that closes early can look like a normal end; a
            // short file must not pass for a complete one.
            status = sink.BodyIncomplete() ? DownloadStatus::Pending : DownloadStatus::Done;
            break;
    }
    const bool opened = sink.FileOpened();
    sink.CloseFile();
    if (!opened) return status;
    if (status != DownloadStatus::Done) std::remove(localPath.c_str());
    if (statusView != nullptr) statusView->OnFileDone(localPath);
    return status;
}
