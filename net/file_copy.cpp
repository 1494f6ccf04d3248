#include "net/file_copy.h"

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "net/location.h"

namespace {

bool Fits(const std::string& path, int64_t sizeLimit) {
    if (sizeLimit < 0) return true;
    try {
        FileStream file;
        file.Open(path);
        return file.GetLength() <= sizeLimit;
    } catch (const Exception&) {
        return false;
    }
}

}  // namespace

DownloadStatus FileCopyTransfer(const std::string& url, const std::string& localPath, int64_t sizeLimit,
                                const CancellationToken& stop, IStatusView* statusView) {
    const std::string source = GetCopySource(url);
    bool tooLarge = false;
    const CopyProgress progress = [&](uint64_t done, uint64_t total) {
        if (statusView != nullptr) {
            statusView->OnFileProgress(localPath, static_cast<uint32_t>(done), static_cast<uint32_t>(total));
        }
        tooLarge = sizeLimit >= 0 && total > static_cast<uint64_t>(sizeLimit);
        return !stop.IsCancelled() && !tooLarge;
    };
    // Sized before and after: not every platform reports progress, and the
    // source may grow while it is copied. A failed copy leaves nothing.
    DownloadStatus status = DownloadStatus::Done;
    if (!Fits(source, sizeLimit) || !CopyFileWithProgress(source, localPath, progress)) {
        status = !tooLarge && stop.IsCancelled() ? DownloadStatus::Cancelled : DownloadStatus::Failed;
    } else if (!Fits(localPath, sizeLimit)) {
        RemoveFile(localPath);
        status = DownloadStatus::Failed;
    }
    if (status == DownloadStatus::Failed) LOG(Error) << "Undefined error while downloading. URL: " << url;
    if (statusView != nullptr) statusView->OnFileDone(localPath);
    return status;
}
