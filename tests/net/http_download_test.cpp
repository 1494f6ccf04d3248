// The downloader against a real HTTP server on 127.0.0.1: WinINet in the
// Windows build, libcurl natively; both must behave the same.
#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include "base/paths.h"
#include "net/http_downloader.h"
#include "net/sign_url.h"
#include "tests/net/download_test_helpers.h"
#include "tests/support/http_test_server.h"
#include "tests/support/test_files.h"

namespace {

using namespace std::chrono_literals;

// A body that takes seconds to send, so a stop lands mid-transfer; a stop
// that is ignored shows as Done (and a slow test).
HttpTestResponse Slow(size_t size = 2000000) {
    HttpTestResponse response;
    response.body = TestBytes(size);
    response.pieceSize = 1000;
    response.pause = 5ms;
    return response;
}

HttpTestResponse Answer(int status, const std::string& body, bool sendLength = true) {
    HttpTestResponse response;
    response.status = status;
    response.body = body;
    response.sendLength = sendLength;
    return response;
}

class HttpDownloadTest : public ::testing::Test {
protected:
    HttpTestServer server;
    TempFolder folder;
    RecordingView view;
};

struct StatusCase {
    const char* name;
    HttpTestResponse response;
    DownloadStatus expected;
};

TEST_F(HttpDownloadTest, EachServerAnswerGivesItsStatusAndOnlyACompleteFileStays) {
    const std::string body = TestBytes(5000);
    HttpTestResponse brokenOff = Answer(200, body);
    brokenOff.breakOffAfter = 2000;
    const StatusCase cases[] = {
        {"with-length", Answer(200, body), DownloadStatus::Done},
        {"without-length", Answer(200, body, false), DownloadStatus::Done},
        {"empty", Answer(200, ""), DownloadStatus::Done},
        {"not-found", Answer(404, "gone"), DownloadStatus::NotFound},
        {"unauthorized", Answer(401, "no"), DownloadStatus::Failed},
        {"server-error", Answer(500, "oops"), DownloadStatus::Failed},
        {"forbidden", Answer(403, "no"), DownloadStatus::Failed},
        {"broken-off", brokenOff, DownloadStatus::Pending},
    };
    for (const StatusCase& item : cases) {
        SCOPED_TRACE(item.name);
        server.Serve(std::string("/") + item.name, item.response);
        const std::string target = folder / (std::string(item.name) + ".bin");
        HttpDownloader downloader;
        downloader.Download(server.Url(std::string("/") + item.name), target, false);
        EXPECT_EQ(FinalStatus(downloader), item.expected);
        if (item.expected == DownloadStatus::Done) {
            EXPECT_EQ(ReadTextFile(target), item.response.body);
        } else {
            EXPECT_FALSE(PathExists(target));
        }
    }
}

TEST_F(HttpDownloadTest, RefusedAnswersLeaveAnExistingFileAlone) {
    // Nothing is created or truncated before the status is known.
    server.Serve("/missing", Answer(404, "gone"));
    server.Serve("/broken", Answer(500, "oops"));
    for (const char* path : {"/missing", "/broken"}) {
        const std::string target = folder / "kept.bin";
        WriteTextFile(target, "old content");
        HttpDownloader downloader;
        downloader.SetStatusView(&view);
        downloader.Download(server.Url(path), target, false);
        FinalStatus(downloader);
        EXPECT_EQ(ReadTextFile(target), "old content") << path;
    }
    EXPECT_TRUE(view.Reports().empty());
    EXPECT_TRUE(view.Finished().empty());
}

TEST_F(HttpDownloadTest, UnreachableServerFailsWithoutAFile) {
    uint16_t port = 0;
    TestSocket::ListenOnLoopback(port).Close();  // a port nobody listens on any more
    const std::string target = folder / "a.bin";
    HttpDownloader downloader;
    downloader.SetStatusView(&view);
    downloader.Download("http://127.0.0.1:" + std::to_string(port) + "/a.bin", target, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Failed);
    EXPECT_FALSE(PathExists(target));
    EXPECT_TRUE(view.Finished().empty());
}

TEST_F(HttpDownloadTest, ProgressRunsFromZeroToTheLengthOrAgainstTheAssumedMegabyte) {
    const std::string body = TestBytes(150000);
    server.Serve("/sized.bin", Answer(200, body));
    server.Serve("/unsized.bin", Answer(200, body, false));
    const struct {
        const char* path;
        uint32_t total;
    } cases[] = {{"/sized.bin", 150000}, {"/unsized.bin", 1048576}};
    for (const auto& item : cases) {
        SCOPED_TRACE(item.path);
        RecordingView progress;
        const std::string target = folder / item.path;
        HttpDownloader downloader;
        downloader.SetStatusView(&progress);
        downloader.Download(server.Url(item.path), target, false);
        ASSERT_EQ(FinalStatus(downloader), DownloadStatus::Done);

        const auto reports = progress.Reports();
        ASSERT_GE(reports.size(), 2u);
        EXPECT_EQ(reports.front().done, 0u);
        EXPECT_EQ(reports.back().done, 150000u);
        for (size_t i = 0; i < reports.size(); ++i) {
            EXPECT_EQ(reports[i].localPath, target);
            EXPECT_EQ(reports[i].total, item.total);
            if (i > 0) {
                EXPECT_GT(reports[i].done, reports[i - 1].done);
            }
        }
        EXPECT_EQ(progress.Finished(), std::vector<std::string>{target});
    }
}

TEST_F(HttpDownloadTest, RequestsNameTheAgentAndAcceptAnything) {
    server.Serve("/a.bin", Answer(200, "x"));
    HttpDownloader downloader;
    downloader.Download(server.Url("/a.bin"), folder / "a.bin", false);
    ASSERT_EQ(FinalStatus(downloader), DownloadStatus::Done);
    const auto requests = server.Requests();
    ASSERT_EQ(requests.size(), 1u);
    EXPECT_EQ(requests[0].target, "/a.bin");
    EXPECT_EQ(requests[0].Header("User-Agent"), "IronvaleUpdater");
    EXPECT_EQ(requests[0].Header("Accept"), "*/*");
}

TEST_F(HttpDownloadTest, SignedRequestsPassTheServersCheckAndUnsignedOnesDoNot) {
    HttpTestResponse guarded = Answer(200, "patch");
    guarded.requireSignature = true;
    server.Serve("/patchinfo.xml", guarded);
    const struct {
        const char* name;
        std::string url;
        bool sign;
        int64_t clockOffset;
        DownloadStatus expected;
    } cases[] = {
        {"signed", server.Url("/patchinfo.xml"), true, 0, DownloadStatus::Done},
        {"signed-with-query", server.Url("/patchinfo.xml?lang=en"), true, 0, DownloadStatus::Done},
        {"unsigned", server.Url("/patchinfo.xml"), false, 0, DownloadStatus::Failed},
        // Our clock two hours ahead of the server's: the expiry must follow
        // the server's clock, which makes this address an hour old.
        {"expired", server.Url("/patchinfo.xml"), true, -7200, DownloadStatus::Failed},
    };
    for (const auto& item : cases) {
        SCOPED_TRACE(item.name);
        SetServerClockOffset(item.clockOffset);
        HttpDownloader downloader;
        downloader.Download(item.url, folder / "patchinfo.xml", item.sign);
        EXPECT_EQ(FinalStatus(downloader), item.expected);
        SetServerClockOffset(0);
    }
}

TEST_F(HttpDownloadTest, StopDuringAReadCancelsAndRemovesThePartialFile) {
    server.Serve("/big.bin", Slow());
    const std::string target = folder / "big.bin";
    HttpDownloader downloader;
    downloader.SetStatusView(&view);
    view.StopAt(downloader, 1);
    downloader.Download(server.Url("/big.bin"), target, false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Cancelled);
    EXPECT_FALSE(PathExists(target));
    EXPECT_EQ(view.Finished(), std::vector<std::string>{target});
}

TEST_F(HttpDownloadTest, ListStopsAtTheFirstFailureAndLeavesTheRestPending) {
    server.Serve("/one.bin", Answer(200, "1"));
    server.Serve("/three.bin", Answer(200, "3"));
    const std::list<DownloadEntry> list = {
        DownloadEntry(server.Url("/one.bin"), folder / "one.bin"),
        DownloadEntry(server.Url("/two.bin"), folder / "two.bin"),
        DownloadEntry(server.Url("/three.bin"), folder / "three.bin"),
    };
    HttpDownloader downloader;
    downloader.Start(list, false);
    EXPECT_EQ(downloader.WaitForFile("three.bin"), DownloadStatus::Failed);
    EXPECT_EQ(downloader.WaitForFile("one.bin"), DownloadStatus::Done);
    EXPECT_EQ(downloader.WaitForFile("two.bin"), DownloadStatus::NotFound);

    std::vector<DownloadStatus> outcomes;
    for (const DownloadEntry& entry : downloader.Entries()) outcomes.push_back(entry.status);
    EXPECT_EQ(outcomes,
              (std::vector<DownloadStatus>{DownloadStatus::Done, DownloadStatus::NotFound, DownloadStatus::Pending}));
    EXPECT_FALSE(PathExists(folder / "three.bin"));
    EXPECT_EQ(server.Requests().size(), 2u);
}

TEST_F(HttpDownloadTest, WaitForFileReturnsEachFileAsItArrives) {
    // The first file is ready while the second is still on its way; a
    // second entry with the same file name is never the one waited for.
    server.Serve("/first/a.bin", Answer(200, "a"));
    server.Serve("/second/a.bin", Slow());
    server.Serve("/b.bin", Slow());
    MakeDirectories(folder / "first");
    MakeDirectories(folder / "second");
    const std::list<DownloadEntry> list = {
        DownloadEntry(server.Url("/first/a.bin"), folder / "first/a.bin"),
        DownloadEntry(server.Url("/second/a.bin"), folder / "second/a.bin"),
        DownloadEntry(server.Url("/b.bin"), folder / "b.bin"),
    };
    HttpDownloader downloader;
    downloader.Start(list, false);
    EXPECT_EQ(downloader.WaitForFile("a.bin"), DownloadStatus::Done);
    EXPECT_EQ(ReadTextFile(folder / "first/a.bin"), "a");
    EXPECT_EQ(downloader.Entries().back().status, DownloadStatus::Pending);
    downloader.RequestStop();
    // Names compare case-sensitively: "A.bin" is not in the list.
    EXPECT_EQ(downloader.WaitForFile("A.bin"), DownloadStatus::Cancelled);
    downloader.WaitForWorker();
    EXPECT_EQ(downloader.WaitForFile("A.bin"), DownloadStatus::Failed);
    EXPECT_EQ(downloader.WaitForFile("nowhere.bin"), DownloadStatus::Failed);
}

TEST_F(HttpDownloadTest, StopWhileTheCallerWaitsWakesItAtOnce) {
    server.Serve("/big.bin", Slow());
    HttpDownloader downloader;
    downloader.SetStatusView(&view);
    downloader.Download(server.Url("/big.bin"), folder / "big.bin", false);
    std::thread canceller([&] {
        view.WaitForBytes();
        downloader.RequestStop();
    });
    EXPECT_EQ(downloader.WaitForFile("big.bin"), DownloadStatus::Cancelled);
    canceller.join();
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Cancelled);
    EXPECT_FALSE(PathExists(folder / "big.bin"));
}

TEST_F(HttpDownloadTest, StartRefusesWhileBusyAndWorksAgainOnceTheWorkerEnded) {
    server.Serve("/big.bin", Slow());
    server.Serve("/small.bin", Answer(200, "small"));
    HttpDownloader downloader;
    downloader.Download(server.Url("/big.bin"), folder / "big.bin", false);
    EXPECT_EQ(ThrownMessage([&] { downloader.Download(server.Url("/small.bin"), folder / "small.bin", false); }),
              "Downloader is busy.");
    downloader.RequestStop();
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Cancelled);

    // A new Start clears the earlier stop and fetches its own list.
    downloader.Download(server.Url("/small.bin"), folder / "small.bin", false);
    EXPECT_EQ(FinalStatus(downloader), DownloadStatus::Done);
    EXPECT_EQ(downloader.Entries().size(), 1u);
    EXPECT_EQ(ReadTextFile(folder / "small.bin"), "small");
}

TEST_F(HttpDownloadTest, DestroyingARunningDownloaderStopsItAndLeavesNoFile) {
    server.Serve("/big.bin", Slow());
    {
        HttpDownloader downloader;
        downloader.SetStatusView(&view);
        downloader.Download(server.Url("/big.bin"), folder / "big.bin", false);
        view.WaitForBytes();
    }
    EXPECT_FALSE(PathExists(folder / "big.bin"));
}

TEST(HttpDownloaderMisuse, RefusesEmptyListsAndWaitsBeforeAnyStart) {
    HttpDownloader downloader;
    EXPECT_EQ(ThrownMessage([&] { downloader.WaitForFile("a.bin"); }), "HttpDownloader not started.");
    EXPECT_EQ(ThrownMessage([&] { downloader.Start({}, false); }), "No files to download.");
    EXPECT_EQ(ThrownMessage([&] { downloader.WaitForFile("a.bin"); }), "HttpDownloader not started.");
    EXPECT_FALSE(downloader.WaitForWorker());
}

}  // namespace
