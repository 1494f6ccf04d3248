// ironvale-patch fetch URL OUT: one transfer through the updater's own
// downloader, to check a patch server by hand and to measure the downloader.
#include <cstdio>

#include "net/http_downloader.h"
#include "tools/ironvale_patch/command.h"

namespace {

const char kUsage[] = "fetch URL OUT    fetch one location as the updater does (unsigned)";

const char* StatusName(DownloadStatus status) {
    switch (status) {
        case DownloadStatus::Pending:
            return "incomplete";
        case DownloadStatus::Done:
            return "done";
        case DownloadStatus::Failed:
            return "failed";
        case DownloadStatus::Cancelled:
            return "cancelled";
        case DownloadStatus::NotFound:
            return "not found";
        case DownloadStatus::Unsupported:
            return "unsupported location";
        case DownloadStatus::Corrupt:
            return "not as declared";
    }
    return "unknown";
}

int Fetch(const std::vector<std::string>& args) {
    if (args.size() != 2) return UsageError(kUsage);
    HttpDownloader downloader;
    downloader.Download(args[0], args[1], false);
    downloader.WaitForWorker();
    const DownloadStatus status = downloader.Entries().front().status;
    if (status == DownloadStatus::Done) return 0;
    std::fprintf(stderr, "ironvale-patch: fetch %s: %s\n", args[0].c_str(), StatusName(status));
    return 1;
}

const CommandRegistration registration("fetch", kUsage, &Fetch);

}  // namespace
