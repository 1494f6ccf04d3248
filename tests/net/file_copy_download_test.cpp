// Locations that are copied rather than fetched: file:// addresses, UNC
// paths and paths relative to the program's folder.
#include <gtest/gtest.h>

#include <filesystem>
#include <random>

#include "base/paths.h"
#include "net/http_downloader.h"
#include "net/location.h"
#include "tests/net/download_test_helpers.h"
#include "tests/support/test_files.h"

namespace {

class FileCopyDownloadTest : public ::testing::Test {
protected:
    FileCopyDownloadTest() : source(folder / "source.bin"), target(folder / "target.bin") {
        WriteTextFile(source, TestBytes(3 * 1024 * 1024 + 17));
    }

    TempFolder folder;
    std::string source;
    std::string target;
    RecordingView view;
};

TEST_F(FileCopyDownloadTest, FileAddressesInAnyLetterCaseAndUncPathsAreCopied) {
    const std::string locations[] = {"file://" + source, "FILE://" + source, "File://" + source, UncFormOf(source)};
    for (const std::string& location : locations) {
        SCOPED_TRACE(location);
        RecordingView progress;
        HttpDownloader downloader;
        downloader.SetStatusView(&progress);
        downloader.Download(location, target, false);
        ASSERT_EQ(FinalStatus(downloader), DownloadStatus::Done);
        EXPECT_EQ(ReadTextFile(target), ReadTextFile(source));
        EXPECT_EQ(progress.Finished(), std::vector<std::string>{target});
        if (PlatformCopyReportsProgress()) {
            const auto reports = progress.Reports();
            ASSERT_FALSE(reports.empty());
            EXPECT_EQ(reports.back().done, 3u * 1024 * 1024 + 17);
            EXPECT_EQ(reports.back().total, 3u * 1024 * 1024 + 17);
        }
        std::remove(target.c_str());
    }
}

TEST_F(FileCopyDownloadTest, RelativeLocationsAreReadBesideTheProgram) {
    const std::string name = "ivl-relative-" + std::to_string(std::random_device()());
    const std::string besideProgram = PathJoin(GetProgramFolder(), name);
    MakeDirectories(PathJoin(besideProgram, "patches"));
    WriteTextFile(PathJoin(besideProgram, "patches/a.bin"), "archive");

    HttpDownloader downloader;
    downloader.Download(name + "\\patches\\a.bin", target, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Done);
    EXPECT_EQ(ReadTextFile(target), "archive");
    // The entry now names where the file was really read from.
    EXPECT_EQ(downloader.Entries().front().url, PathJoin(GetProgramFolder(), name + "/patches/a.bin"));
    std::error_code ignored;
    std::filesystem::remove_all(besideProgram, ignored);
}

TEST_F(FileCopyDownloadTest, AbsoluteLocalPathsAreRefused) {
    CapturedLog log;
    HttpDownloader downloader;
    downloader.SetStatusView(&view);
    downloader.Download(AbsoluteLocation(), target, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Unsupported);
    EXPECT_FALSE(PathExists(target));
    EXPECT_TRUE(view.Finished().empty());
    EXPECT_NE(log.Text().find("Error: Download error, protocol not supported. URL: " + AbsoluteLocation() + "\r\n"),
              std::string::npos);
}

TEST_F(FileCopyDownloadTest, FailedCopiesAreLoggedAndLeaveNoFile) {
    // An https:// address is not fetched: it reads as a path beside the
    // program, which does not exist.
    const struct {
        const char* name;
        std::string location;
        std::string logged;
    } cases[] = {
        {"https", "https://patches.example.com/a.bin",
         PathJoin(GetProgramFolder(), "https://patches.example.com/a.bin")},
        {"missing", "file://" + (folder / "missing.bin"), "file://" + (folder / "missing.bin")},
        {"folder", "file://" + folder.Path(), "file://" + folder.Path()},
    };
    for (const auto& item : cases) {
        SCOPED_TRACE(item.name);
        CapturedLog log;
        RecordingView progress;
        HttpDownloader downloader;
        downloader.SetStatusView(&progress);
        downloader.Download(item.location, target, false);
        EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Failed);
        EXPECT_FALSE(PathExists(target));
        EXPECT_EQ(progress.Finished(), std::vector<std::string>{target});
        EXPECT_NE(log.Text().find("Error: Undefined error while downloading. URL: " + item.logged + "\r\n"),
                  std::string::npos);
    }
}

TEST_F(FileCopyDownloadTest, StopDuringACopyCancelsWithoutAFileOrAnErrorLine) {
    if (!PlatformCopyReportsProgress()) GTEST_SKIP() << "this platform's file copy cannot be cancelled part-way";
    CapturedLog log;
    HttpDownloader downloader;
    downloader.SetStatusView(&view);
    view.StopAt(downloader, 0);
    downloader.Download("file://" + source, target, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Cancelled);
    EXPECT_FALSE(PathExists(target));
    EXPECT_EQ(view.Finished(), std::vector<std::string>{target});
    EXPECT_EQ(log.Text().find("Undefined error"), std::string::npos);
}

TEST_F(FileCopyDownloadTest, CopyOntoItsOwnSourceFailsAndKeepsTheSource) {
    const std::string before = ReadTextFile(source);
    HttpDownloader downloader;
    downloader.Download("file://" + source, source, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Failed);
    EXPECT_EQ(ReadTextFile(source), before);
}

}  // namespace
