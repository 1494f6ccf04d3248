// Which version is the latest, and fetching the description of the patch
// or build that leads to it: read once, checked, and parsed from the very
// bytes that were checked.
#include <algorithm>
#include <chrono>
#include <thread>

#include "app/updater.h"
#include "app/version_text.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "base/version_order.h"
#include "net/location.h"
#include "net/signature_check.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "text/localization.h"

namespace {

// Its first word is all that counts: a hostile file cannot make us read
// more.
constexpr int64_t kLatestVersionFileLimit = 1024;

}  // namespace

// The transfers of the version check and the descriptions go through the
// run's one downloader, so that the window's cancel reaches them as well.
std::string Updater::CheckLatestVersion() {
    gui.SetStatusText(Localize("INSTALLER_RETRIEVING_VERSION_STATUS"));
    const std::string temp = MakeTempFileName("ivl");
    DownloadEntry entry(configuration.GetLatestVersionUrl(), temp);
    entry.sizeLimit = kLatestVersionFileLimit;
    downloader.SetStatusView(nullptr);
    downloader.Start({entry}, false);
    if (firstVersionCheck) {
        // The first check shows the bar filling over three seconds while
        // the file arrives, and notices a cancel within 50 ms.
        gui.SetProgressTotal(0);
        for (int step = 1; step <= 60 && !quitRequested.IsCancelled(); ++step) {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            gui.SetProgressTotal(std::min(step * 50 * 1000 / 3000, 1000));
        }
        quitRequested.ThrowIfCancelled("User cancelled during version check.");
        firstVersionCheck = false;
    }
    if (!downloader.WaitForWorker() || downloader.Entries().front().status != DownloadStatus::Done) {
        RemoveFile(temp);
        quitRequested.ThrowIfCancelled("User cancelled during version check.");
        throw Exception("Failed to download latest version file.", ErrorCode::FileNotFound);
    }
    gui.SetProgressTotal(1000);
    std::string text;
    const bool read = ReadFileBytes(temp, kLatestVersionFileLimit, text);
    RemoveFile(temp);
    if (!read) throw Exception("Failed to open latest version file.", ErrorCode::FileNotFound);
    const std::string latest = FirstWord(text);
    if (latest.empty()) throw Exception("Failed to read latest version file.", ErrorCode::FileNotFound);
    return latest;
}

void Updater::FetchDescription(const PatchBatch& batch, CheckedDescription& fetched, PatchInfoFile& description) {
    const std::string name = configuration.GetPatchInfoFilename();
    if (!FetchBytes(JoinLocation(batch.location, name), kMaximumSignedFileSize, true, fetched.text)) {
        throw Exception("Failed to download patch info file.", ErrorCode::PatchNotFound);
    }
    // Not one element of an unsigned description is read when a signature
    // is required.
    if (!publisherKey.empty() &&
        !FetchBytes(JoinLocation(batch.location, name + ".sig"), kMaximumSignatureFileSize, true, fetched.signature)) {
        throw Exception("The patch description's signature could not be downloaded.", ErrorCode::CorruptData);
    }
    CheckDescription(fetched, batch.version, description);
}

void Updater::FetchBuildDescription(const PatchBatch& build, CheckedDescription& fetched, PatchInfoFile& description) {
    try {
        FetchDescription(build, fetched, description);
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::PatchNotFound)
            throw Exception("Could not find build.", ErrorCode::BuildNotFound);
        throw;
    }
}

bool Updater::FetchBytes(const std::string& url, int64_t limit, bool signUrl, std::string& bytes) {
    const std::string temp = MakeTempFileName("ivl");
    DownloadEntry entry(url, temp);
    entry.sizeLimit = limit;
    downloader.SetStatusView(nullptr);
    downloader.Start({entry}, signUrl);
    const bool arrived = downloader.WaitForWorker() && downloader.Entries().front().status == DownloadStatus::Done &&
                         ReadFileBytes(temp, limit, bytes);
    RemoveFile(temp);
    quitRequested.ThrowIfCancelled("User cancelled while fetching the patch description.");
    return arrived;
}

// What a signature cannot say by itself: that the description is the one
// asked for, not an older one replayed, and that it vouches for every
// archive it names.
void Updater::CheckDescription(const CheckedDescription& checked, const std::string& version,
                               PatchInfoFile& description) {
    const std::string name = configuration.GetPatchInfoFilename();
    if (!publisherKey.empty()) CheckSignature(checked.text, checked.signature, publisherKey, name);
    description.Parse(checked.text);
    const std::string& leadsTo = description.GetVersion();
    if (leadsTo.empty() ? !publisherKey.empty() : leadsTo != version) {
        throw Exception("The patch description leads to version \"" + leadsTo + "\", not to " + version + ".",
                        ErrorCode::CorruptData);
    }
    if (publisherKey.empty()) return;
    for (const std::string& archive : ArchivesInFetchOrder(description)) {
        if (description.GetDeclaredArchives().count(archive) == 0) {
            throw Exception("The signed patch description declares no size and SHA-256 for " + archive + ".",
                            ErrorCode::CorruptData);
        }
    }
}
