#include "net/file_copy.h"

#include <cstdio>
#include <vector>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "net/kept_download.h"
#include "net/location.h"

namespace {

const uint32_t kPieceSize = 1024 * 1024;

bool Fits(const std::string& path, int64_t sizeLimit) {
    if (sizeLimit < 0) return true;
    const int64_t length = GetFileLength(path);
    return length >= 0 && length <= sizeLimit;
}

}  // namespace

TransferResult FileCopyTransfer(const DownloadEntry& entry, KeptDownload& kept, const TransferContext& context) {
    const std::string source = GetCopySource(entry.url);
    const std::string& localPath = entry.localPath;
    const int64_t sizeLimit = entry.TransferLimit();
    // A source shorter than the kept part is another file: it starts again.
    const uint64_t offset = GetFileLength(source) >= kept.Offset() ? static_cast<uint64_t>(kept.Offset()) : 0;
    bool tooLarge = false;
    TransferResult result{DownloadStatus::Done};
    const CopyProgress progress = [&](uint64_t done, uint64_t total) {
        ReportFileProgress(context.statusView, localPath, done, total);
        tooLarge = sizeLimit >= 0 && total > static_cast<uint64_t>(sizeLimit);
        result.arrived = done;
        return !context.stop.IsCancelled() && !tooLarge;
    };
    if (kept.Allowed() && offset == 0) kept.Begin("");
    // Sized before and after: not every platform reports progress, and the
    // source may grow while it is copied. A failed copy leaves nothing, but
    // a part that may be continued.
    const bool copied =
        Fits(source, sizeLimit) && (kept.Allowed() ? CopyFileFrom(source, localPath, offset, progress, true)
                                                   : CopyFileWithProgress(source, localPath, progress));
    if (!copied) {
        const bool stopped = !tooLarge && context.stop.IsCancelled();
        result.status = stopped ? DownloadStatus::Cancelled : DownloadStatus::Failed;
        // A share that went away part-way may come back.
        result.interrupted = !stopped && !tooLarge;
        if (tooLarge && kept.Allowed()) kept.Forget();
    } else if (!Fits(localPath, sizeLimit)) {
        DiscardFile(localPath);
        result.status = DownloadStatus::Failed;
    }
    if (result.status == DownloadStatus::Failed) LOG(Error) << "Undefined error while downloading. URL: " << entry.url;
    result.reported = true;
    return result;
}

bool CopyFileFrom(const std::string& source, const std::string& destination, uint64_t offset,
                  const CopyProgress& progress, bool keepPart) {
    FileStream in;
    FileStream out;
    try {
        in.Open(source);
    } catch (const Exception&) {
        return false;
    }
    // Opening the destination fails when it is the source itself (the
    // source's read lock keeps the writer out), before anything is lost.
    try {
        if (offset == 0) {
            out.Create(destination);
        } else {
            out.OpenForWrite(destination);
            out.Seek(static_cast<int64_t>(offset), 0);
        }
    } catch (const Exception&) {
        return false;
    }
    bool copied = false;
    try {
        const uint64_t total = static_cast<uint64_t>(in.GetLength());
        in.Seek(static_cast<int64_t>(offset), 0);
        std::vector<char> buffer(kPieceSize);
        uint64_t done = offset;
        bool going = progress(done, total);
        while (going) {
            const uint32_t count = in.Read(buffer.data(), kPieceSize);
            if (count == 0) {
                copied = true;
                break;
            }
            out.Write(buffer.data(), count);
            done += count;
            going = progress(done, total);
        }
    } catch (const Exception&) {
        copied = false;
    }
    out.Close();
    if (!copied && !keepPart) std::remove(destination.c_str());
    return copied;
}
