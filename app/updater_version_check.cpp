// Which version is the latest (confirmed by the publisher's signed
// statement in a program with a key), and fetching the description of the
// patch or build that leads to it: read once, checked, and parsed from the
// very bytes that were checked.
#include <algorithm>
#include <chrono>
#include <thread>

#include "app/updater.h"
#include "app/version_text.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/version_order.h"
#include "net/location.h"
#include "net/sign_url.h"
#include "net/signature_check.h"
#include "net/version_statement.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "text/localization.h"

namespace {

// Its first word is all that counts: a hostile file cannot make us read
// more.
constexpr int64_t kLatestVersionFileLimit = 1024;

// The highest serial of a statement this installation has accepted, kept
// in the game's key: a statement older than one already seen is a replay.
const char kStatementSerialValue[] = "Latest Version Serial";

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
        DiscardFile(temp);
        quitRequested.ThrowIfCancelled("User cancelled during version check.");
        throw Exception("Failed to download latest version file.", ErrorCode::FileNotFound);
    }
    gui.SetProgressTotal(1000);
    std::string text;
    const bool read = ReadFileBytes(temp, kLatestVersionFileLimit, text);
    DiscardFile(temp);
    if (!read) throw Exception("Failed to open latest version file.", ErrorCode::FileNotFound);
    const std::string latest = FirstWord(text);
    if (latest.empty()) throw Exception("Failed to read latest version file.", ErrorCode::FileNotFound);
    if (!publisherKey.empty()) ConfirmLatestVersion(latest);
    return latest;
}

// "version.txt" stays unsigned for every reader that knows nothing else;
// the statement beside it says the same with the publisher's signature, a
// serial and an end.
void Updater::ConfirmLatestVersion(const std::string& latest) {
    std::string statement;
    if (!FetchBytes(configuration.GetLatestVersionUrl() + ".sig", kMaximumStatementFileSize, false, statement)) {
        LOG_AS("Updater", Error) << "The statement of the latest version could not be downloaded.";
        throw Exception("The statement of the latest version could not be downloaded.", ErrorCode::VersionUnconfirmed);
    }
    int64_t highest = 0;
    std::string stored;
    if (registry.ReadString(kStatementSerialValue, stored) && !ParseStatementNumber(stored, highest)) {
        LOG_AS("Updater", Error) << "The accepted serial \"" << stored << "\" cannot be read; taken as 0.";
    }
    const VersionStatement confirmed = CheckVersionStatement(statement, publisherKey, latest, ServerTimeNow(), highest);
    if (confirmed.serial <= highest) return;
    try {
        registry.WriteString(kStatementSerialValue, std::to_string(confirmed.serial));
    } catch (const Exception& error) {
        // Without the rights to the game's key (a run not yet elevated) the
        // serial is kept by the next run that has them.
        LOG_AS("Updater", Error) << error.message;
    }
}

void Updater::RefuseOlderLatest(const UpdateFacts& facts) const {
    // The plan never patches back; a keyed program says so. An installation
    // in change ("-1") has no version to compare with.
    if (publisherKey.empty() || facts.installedVersion == "-1" ||
        !IsOlderVersion(facts.latestVersion, facts.installedVersion)) {
        return;
    }
    LOG_AS("Updater", Error) << "Version " << facts.latestVersion << " is older than the installed "
                             << facts.installedVersion << ": refused, the installation stays as it is.";
}

void Updater::FetchDescription(const PatchBatch& batch, CheckedDescription& fetched, PatchInfoFile& description) {
    FetchCheckedDescription(batch, fetched, description);
    // Signed pieces of two releases mixed: a patch made for another
    // installed version. The complete build fits any installation.
    if (!publisherKey.empty() && description.GetFromVersion() != installationData.currentVersion) {
        throw Exception("The patch starts from version \"" + description.GetFromVersion() +
                            "\", not from the installed " + installationData.currentVersion + ".",
                        ErrorCode::DeltaFailed);
    }
}

void Updater::FetchCheckedDescription(const PatchBatch& batch, CheckedDescription& fetched,
                                      PatchInfoFile& description) {
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
        FetchCheckedDescription(build, fetched, description);
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
    DiscardFile(temp);
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
