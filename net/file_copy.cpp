#include "net/file_copy.h"

#include "base/cancellation.h"
#include "base/log.h"
#include "net/location.h"

DownloadStatus FileCopyTransfer(const std::string& url, const std::string& localPath, const CancellationToken& stop,
                                IStatusView* statusView) {
    const CopyProgress progress = [&](uint64_t done, uint64_t total) {
        if (statusView != nullptr) {
            statusView->OnFileProgress(localPath, static_cast<uint32_t>(done), static_cast<uint32_t>(total));
        }
        return !stop.IsCancelled();
    };
    DownloadStatus status = DownloadStatus::Done;
    if (!CopyFileWithProgress(GetCopySource(url), localPath, progress)) {
        if (stop.IsCancelled()) {
            status = DownloadStatus::Cancelled;
        } else {
            status = DownloadStatus::Failed;
            LOG(Error) << "Undefined error while downloading. URL: " << url;
        }
    }
    if (statusView != nullptr) statusView->OnFileDone(localPath);
    return status;
}
