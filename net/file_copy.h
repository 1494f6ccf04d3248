#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "base/status_interfaces.h"
#include "net/download_entry.h"

class CancellationToken;

// Copies the file a file:// address, UNC path or resolved relative path
// names to localPath, overwriting it, with progress to statusView (may be
// null) and a stop that cancels the copy. A source larger than sizeLimit
// bytes (unless it is -1) is Failed and leaves nothing. Logs a failure
// that no stop caused.
DownloadStatus FileCopyTransfer(const std::string& url, const std::string& localPath, int64_t sizeLimit,
                                const CancellationToken& stop, IStatusView* statusView);

// Told the bytes copied so far and the source's size; returns false to
// cancel the copy.
using CopyProgress = std::function<bool(uint64_t done, uint64_t total)>;

// The platform's file copy: source over destination, progress after every
// piece. False when the copy failed or was cancelled; it then leaves no
// partial destination behind.
bool CopyFileWithProgress(const std::string& source, const std::string& destination, const CopyProgress& progress);
