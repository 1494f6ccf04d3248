#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "net/download_entry.h"
#include "net/transfer.h"

class KeptDownload;

// Copies the file the entry's file:// address, UNC path or resolved
// relative path names to its localPath, with progress to the context's
// view and a stop that cancels the copy. A part kept from an earlier
// attempt is continued from its end. A source larger than the entry's
// TransferLimit() is Failed and leaves nothing. Logs a failure that no stop
// caused.
TransferResult FileCopyTransfer(const DownloadEntry& entry, KeptDownload& kept, const TransferContext& context);

// Told the bytes copied so far and the source's size; returns false to
// cancel the copy.
using CopyProgress = std::function<bool(uint64_t done, uint64_t total)>;

// The platform's file copy: source over destination, progress after every
// piece. False when the copy failed or was cancelled; it then leaves no
// partial destination behind.
[[nodiscard]] bool CopyFileWithProgress(const std::string& source, const std::string& destination,
                                        const CopyProgress& progress);

// Copies source from offset on into destination at the same offset, in
// pieces, with progress counted from the start of the file. A copy that
// fails or is cancelled leaves what it copied when keepPart is set, else no
// destination at all.
[[nodiscard]] bool CopyFileFrom(const std::string& source, const std::string& destination, uint64_t offset,
                                const CopyProgress& progress, bool keepPart);
