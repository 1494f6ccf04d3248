#include "net/http_transfer.h"

#include <cstdio>
#include <regex>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "net/http_transport.h"
#include "net/kept_download.h"

namespace {

// Progress of a server that sends no length is measured against this.
const uint32_t kAssumedLength = 1048576;

// A count of bytes as a header writes it; false for anything else.
bool ParseCount(const std::string& text, int64_t& value) {
    if (text.empty() || text.size() > 18 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    value = std::stoll(text);
    return true;
}

class FileSink final : public HttpResponseSink {
public:
    FileSink(const DownloadEntry& downloadEntry, KeptDownload& keptPart, const TransferContext& transferContext)
        : entry(downloadEntry), kept(keptPart), context(transferContext) {}

    bool OnResponse(const HttpResponseHead& head) override {
        if (head.status == "404") {
            refusal = DownloadStatus::NotFound;
            return false;
        }
        int64_t length = -1;
        if (!ParseCount(head.contentLength, length)) length = -1;
        if (kept.Offset() > 0 && head.status != "200") {
            // Asked to continue: only the rest of the very bytes kept will do.
            if (!Continues(head, length)) {
                LOG(Error) << "The server did not continue " << entry.localPath << " at byte " << kept.Offset() << " ("
                           << head.status << ", \"" << head.contentRange << "\"); fetching it from the start.";
                restart = true;
                return false;
            }
            start = kept.Offset();
        } else if (!head.status.empty() && head.status != "200") {
            // A status that cannot be read is taken as success.
            return false;
        } else if (kept.Allowed()) {
            // The whole file, whatever was asked: it starts afresh under
            // the validator of this answer.
            kept.Begin(ChooseValidator(head.etag, head.lastModified));
        }
        if (length >= 0 && RunsPastLimit(start + length)) return false;
        expectedBody = length;
        total = entry.declaredSize >= 0 ? static_cast<uint64_t>(entry.declaredSize)
                : length >= 0           ? static_cast<uint64_t>(length)
                                        : kAssumedLength;
        try {
            if (start == 0) {
                file.Create(entry.localPath);
            } else {
                file.OpenForWrite(entry.localPath);
                file.Seek(start, 0);
            }
        } catch (const Exception&) {
            return false;
        }
        ReportFileProgress(context.statusView, entry.localPath, start, total);
        return true;
    }

    bool KeepReading() override { return !context.stop.IsCancelled(); }

    bool OnData(const char* data, uint32_t size) override {
        // Not one byte past what the publisher declared reaches the disk.
        if (RunsPastLimit(start + received + size)) return false;
        received += size;
        ReportFileProgress(context.statusView, entry.localPath, start + received, total);
        try {
            file.Write(data, size);
        } catch (const Exception&) {
            return false;
        }
        return true;
    }

    bool FileOpened() const { return file.IsOpen(); }
    // True when the body fell short of (or ran past) the length the server announced.
    bool BodyIncomplete() const { return expectedBody >= 0 && received != static_cast<uint64_t>(expectedBody); }
    // Where the file ends now.
    uint64_t Arrived() const { return start + received; }
    // The answer did not continue the kept part: the file must start again.
    bool Restart() const { return restart; }
    DownloadStatus Refusal() const { return refusal; }
    void CloseFile() { file.Close(); }

private:
    // A 206 whose range is the rest of the declared file from the kept
    // offset, under the validator the part was fetched with.
    bool Continues(const HttpResponseHead& head, int64_t length) const {
        static const std::regex form(R"(bytes ([0-9]{1,18})-([0-9]{1,18})/([0-9]{1,18}))");
        std::smatch range;
        if (head.status != "206" || !std::regex_match(head.contentRange, range, form)) return false;
        const int64_t first = std::stoll(range[1].str()), last = std::stoll(range[2].str());
        const int64_t whole = std::stoll(range[3].str());
        const std::string validator = ChooseValidator(head.etag, head.lastModified);
        return first == kept.Offset() && whole == entry.declaredSize && last == whole - 1 &&
               (length < 0 || length == whole - first) &&
               (validator.empty() || kept.Validator().empty() || validator == kept.Validator());
    }

    bool RunsPastLimit(uint64_t length) const {
        const int64_t limit = entry.TransferLimit();
        if (limit < 0 || length <= static_cast<uint64_t>(limit)) return false;
        LOG(Error) << "The transfer to " << entry.localPath << " runs past the declared " << limit << " bytes.";
        return true;
    }

    const DownloadEntry& entry;
    KeptDownload& kept;
    const TransferContext& context;
    FileStream file;
    uint64_t start = 0;  // where the body lands in the file
    int64_t expectedBody = -1;
    uint64_t total = 0;
    uint64_t received = 0;
    bool restart = false;
    DownloadStatus refusal = DownloadStatus::Failed;
};

}  // namespace

TransferResult HttpTransfer(const std::string& address, const DownloadEntry& entry, KeptDownload& kept,
                            const TransferContext& context) {
    for (;;) {
        std::vector<std::string> headers;
        if (kept.Offset() > 0) {
            headers.push_back("Range: bytes=" + std::to_string(kept.Offset()) + "-");
            if (!kept.Validator().empty()) headers.push_back("If-Range: " + kept.Validator());
        }
        FileSink sink(entry, kept, context);
        const HttpOutcome outcome = HttpGet(address, headers, context.stallTimeout, sink);
        if (sink.Restart()) {
            // Once: without a kept part there is nothing to continue.
            kept.Forget();
            continue;
        }
        TransferResult result;
        switch (outcome) {
            case HttpOutcome::NoSession:
                break;
            case HttpOutcome::NoResponse:
                result.interrupted = true;
                break;
            case HttpOutcome::Abandoned:
                result.status = sink.Refusal();
                break;
            case HttpOutcome::Stopped:
                result.status = DownloadStatus::Cancelled;
                break;
            case HttpOutcome::ReadFailed:
                result = {DownloadStatus::Pending, true};
                break;
            case HttpOutcome::Complete:
                // A connection that closes early can look like a normal
                // end; a short file must not pass for a complete one.
                result.interrupted = sink.BodyIncomplete();
                result.status = result.interrupted ? DownloadStatus::Pending : DownloadStatus::Done;
                break;
        }
        result.arrived = sink.Arrived();
        const bool opened = sink.FileOpened();
        sink.CloseFile();
        if (!opened) return result;
        // What broke off or was stopped is continued later when it may be;
        // anything else that did not finish goes.
        const bool keep =
            kept.Allowed() && (result.status == DownloadStatus::Pending || result.status == DownloadStatus::Cancelled);
        if (result.status != DownloadStatus::Done && !keep) {
            std::remove(entry.localPath.c_str());
            if (kept.Allowed()) kept.Forget();
        }
        result.reported = true;
        return result;
    }
}
