#pragma once

#include <chrono>
#include <cstdint>
#include <string>

#include "base/status_interfaces.h"
#include "net/download_entry.h"

class CancellationToken;

// How one attempt at a file ended.
struct TransferResult {
    DownloadStatus status = DownloadStatus::Failed;
    // The connection could not be made, broke off or went quiet: another
    // attempt may do better.
    bool interrupted = false;
    // The bytes of the file there when the attempt ended, kept ones
    // included: an attempt that got further than any before made progress.
    uint64_t arrived = 0;
    // The view is owed OnFileDone: the transfer got as far as its file (an
    // HTTP answer that was taken, any copy).
    bool reported = false;
};

// What every attempt is given besides its entry.
struct TransferContext {
    const CancellationToken& stop;  // checked before each piece
    IStatusView* statusView;        // may be null
    std::chrono::seconds stallTimeout;
};

// Progress in the view's 32-bit counts: a file past 4 GiB is reported in
// coarser units, so the fraction stays right.
inline void ReportFileProgress(IStatusView* view, const std::string& localPath, uint64_t done, uint64_t total) {
    if (view == nullptr) return;
    while (total > UINT32_MAX) {
        done >>= 1;
        total >>= 1;
    }
    view->OnFileProgress(localPath, static_cast<uint32_t>(done), static_cast<uint32_t>(total));
}
