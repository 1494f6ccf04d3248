// Which version is the latest, and fetching the description of the patch
// or build that leads to it.
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
void Updater::CheckLatestVersion(bool installed) {
    gui.SetStatusText(Localize("INSTALLER_RETRIEVING_VERSION_STATUS"));
    const std::string temp = MakeTempFileName("ivl");
    downloader.SetStatusView(nullptr);
    downloader.Download(configuration.GetLatestVersionUrl(), temp, false);
    if (firstVersionCheck && installed) {
        // The first check shows the bar filling over three seconds while
        // the file arrives, and notices a cancel within 50 ms.
        gui.SetProgressTotal(0);
        for (int step = 1; step <= 60 && !cancelled; ++step) {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            gui.SetProgressTotal(std::min(step * 50 * 1000 / 3000, 1000));
        }
        if (cancelled) throw Exception("User cancelled during version check.", ErrorCode::UserCancelled);
        firstVersionCheck = false;
    }
    if (!downloader.WaitForWorker() || downloader.Entries().front().status != DownloadStatus::Done) {
        if (cancelled) throw Exception("User cancelled during version check.", ErrorCode::UserCancelled);
        throw Exception("Failed to download latest version file.", ErrorCode::FileNotFound);
    }
    gui.SetProgressTotal(1000);
    std::string text;
    if (!ReadStart(temp, text)) throw Exception("Failed to open latest version file.", ErrorCode::FileNotFound);
    latestVersion = FirstWord(text);
    RemoveFile(temp);
    if (latestVersion.empty()) throw Exception("Failed to read latest version file.", ErrorCode::FileNotFound);
}

void Updater::DownloadPatchInfo(const std::string& location, const std::string& folder) {
    patchInfoPath = PathJoin(folder.empty() ? GetTempDirectory() : folder, configuration.GetPatchInfoFilename());
    downloader.SetStatusView(nullptr);
    downloader.Download(JoinLocation(location, configuration.GetPatchInfoFilename()), patchInfoPath, true);
    if (!downloader.WaitForWorker() || downloader.Entries().front().status != DownloadStatus::Done) {
        if (cancelled)
            throw Exception("User cancelled while fetching the patch description.", ErrorCode::UserCancelled);
        throw Exception("Failed to download patch info file.", ErrorCode::PatchNotFound);
    }
    patchInfo.Load(patchInfoPath);
}
