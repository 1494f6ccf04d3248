#pragma once

#include <cstdint>
#include <string>

#include "base/status_interfaces.h"
#include "net/download_entry.h"

class CancellationToken;

// Fetches address into localPath over HTTP, reporting progress after every
// piece to statusView (may be null) and checking stop before each
// read. Only 200 is accepted. A body that would run past sizeLimit bytes
// (unless it is -1) is stopped as Failed. Anything but Done leaves no file
// at localPath.
DownloadStatus HttpTransfer(const std::string& address, const std::string& localPath, int64_t sizeLimit,
                            const CancellationToken& stop, IStatusView* statusView);
