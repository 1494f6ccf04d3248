#pragma once

#include <string>

#include "net/download_entry.h"
#include "net/transfer.h"

class KeptDownload;

// Fetches address (the entry's location, signed when asked) into the
// entry's localPath over HTTP. A part kept from an earlier attempt is
// continued with "Range" and "If-Range"; a 206 counts only when it
// continues exactly there, up to the declared size, under the same
// validator, and anything else fetches the file from its start. Only 200
// is accepted otherwise. A body that would run past the entry's
// TransferLimit() is stopped as Failed. Anything but Done leaves no file at
// localPath unless kept may continue it.
TransferResult HttpTransfer(const std::string& address, const DownloadEntry& entry, KeptDownload& kept,
                            const TransferContext& context);
