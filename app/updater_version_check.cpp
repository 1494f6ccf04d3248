// Which version is the latest, and fetching the description of the patch
// or build that leads to it, checked before anything of it is used.
#include <algorithm>
#include <chrono>
#include <thread>

#include "app/updater.h"
#include "app/version_text.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "net/location.h"
#include "net/signature_check.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "text/localization.h"

namespace {

// The file is downloaded; its first word is all that counts, so a few
// kilobytes are plenty and a hostile file cannot make us read gigabytes.
constexpr uint32_t kLatestVersionReadLimit = 64 * 1024;

bool ReadStart(const std::string& path, std::string& text) {
    try {
        FileStream file;
        file.Open(path);
        text.resize(kLatestVersionReadLimit);
        text.resize(file.Read(text.data(), kLatestVersionReadLimit));
        return true;
    } catch (const Exception&) {
        return false;
    }
}

}  // namespace

// The transfers of the version check and the descriptions go through the
// run's one downloader, so that the window's cancel reaches them as well.
std::string Updater::CheckLatestVersion() {
    gui.SetStatusText(Localize("INSTALLER_RETRIEVING_VERSION_STATUS"));
    const std::string temp = MakeTempFileName("ivl");
    downloader.SetStatusView(nullptr);
    downloader.Download(configuration.GetLatestVersionUrl(), temp, false);
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
        quitRequested.ThrowIfCancelled("User cancelled during version check.");
        throw Exception("Failed to download latest version file.", ErrorCode::FileNotFound);
    }
    gui.SetProgressTotal(1000);
    std::string text;
    if (!ReadStart(temp, text)) throw Exception("Failed to open latest version file.", ErrorCode::FileNotFound);
    const std::string latest = FirstWord(text);
    RemoveFile(temp);
    if (latest.empty()) throw Exception("Failed to read latest version file.", ErrorCode::FileNotFound);
    return latest;
}

std::string Updater::FetchDescription(const PatchBatch& batch, const std::string& folder, PatchInfoFile& description) {
    const std::string name = configuration.GetPatchInfoFilename();
    const std::string path = PathJoin(folder.empty() ? GetTempDirectory() : folder, name);
    if (!FetchOne(DownloadEntry(JoinLocation(batch.location, name), path))) {
        throw Exception("Failed to download patch info file.", ErrorCode::PatchNotFound);
    }
    try {
        // Not one element of an unsigned description is read when a
        // signature is required.
        if (!publisherKey.empty()) CheckDescriptionSignature(batch.location, path);
        description.Load(path);
        CheckDescriptionContent(batch, description);
    } catch (const Exception&) {
        RemoveFile(path);
        throw;
    }
    return path;
}

std::string Updater::FetchBuildDescription(const PatchBatch& build, PatchInfoFile& description) {
    try {
        return FetchDescription(build, "", description);
    } catch (const Exception& error) {
        if (error.Code() == ErrorCode::PatchNotFound)
            throw Exception("Could not find build.", ErrorCode::BuildNotFound);
        throw;
    }
}

bool Updater::FetchOne(const DownloadEntry& entry) {
    downloader.SetStatusView(nullptr);
    downloader.Start({entry}, true);
    if (downloader.WaitForWorker() && downloader.Entries().front().status == DownloadStatus::Done) return true;
    quitRequested.ThrowIfCancelled("User cancelled while fetching the patch description.");
    return false;
}

void Updater::CheckDescriptionSignature(const std::string& location, const std::string& path) {
    const std::string name = configuration.GetPatchInfoFilename() + ".sig";
    const std::string signaturePath = path + ".sig";
    try {
        if (!FetchOne(DownloadEntry(JoinLocation(location, name), signaturePath))) {
            throw Exception("The patch description's signature could not be downloaded.", ErrorCode::CorruptData);
        }
        CheckFileSignature(path, signaturePath, publisherKey);
    } catch (const Exception&) {
        RemoveFile(signaturePath);
        throw;
    }
    RemoveFile(signaturePath);
}

// What a signature cannot say by itself: that the description is the one
// asked for, not an older one replayed, and that it vouches for every
// archive it names.
void Updater::CheckDescriptionContent(const PatchBatch& batch, PatchInfoFile& description) {
    const std::string& leadsTo = description.GetVersion();
    if (leadsTo.empty() ? !publisherKey.empty() : leadsTo != batch.version) {
        throw Exception("The patch description leads to version \"" + leadsTo + "\", not to " + batch.version + ".",
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
