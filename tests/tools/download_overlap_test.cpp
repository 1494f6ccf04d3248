// Stage one works on each archive as soon as it has arrived, while the
// downloader still fetches the next ones from a slow server.
#include <gtest/gtest.h>

#include "base/paths.h"
#include "net/http_downloader.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/http_test_server.h"

namespace {

TEST(DownloadOverlap, EachArchiveIsPreparedWhileTheNextOneDownloads) {
    // Archive "k.dat" holds the delta of "k/diffk" and a large incompressible
    // new file, so it takes a while to arrive at the server's pace.
    Tree installed;
    Tree target;
    for (const std::string k : {"1", "2", "3"}) {
        installed.File(k + "/diff" + k, SeededBytes(5000, k[0]));
        target.File(k + "/diff" + k, SeededBytes(4000, k[0]) + "changed tail");
        target.File(k + "/bulk.bin", SeededBytes(48 * 1024, 10 + k[0]));
    }
    TestBatch batch(installed, target);
    HttpTestServer server;
    HttpTestResponse slow;
    slow.pieceSize = 4096;
    slow.pause = std::chrono::milliseconds(25);
    server.ServeFolder("/patch/", batch.PatchFolder(), slow);

    TempFolder downloads;
    HttpDownloader downloader;
    BatchRun run(batch);
    run.work.patchFolder = downloads.Path();
    // The diffs come first, one per archive in list order: reaching the diff
    // of archive k means those before it are rebuilt, and that must happen
    // before archive k has arrived.
    std::vector<std::string> arrivedTooEarly;
    run.onReport = [&](const std::string& fileName) {
        for (const DownloadEntry& entry : downloader.Entries()) {
            const bool done = entry.status == DownloadStatus::Done;
            if (done && "diff" + GetFileName(entry.localPath).substr(0, 1) == fileName)
                arrivedTooEarly.push_back(fileName);
        }
    };
    downloader.Start(MakeDownloadList(ArchivesInFetchOrder(run.info), server.Url("/patch"), downloads.Path()), false);
    run.stages.Prepare(run.work, &downloader, &run);
    run.Apply();
    EXPECT_EQ(ReadTree(batch.Installation()), target);
    EXPECT_EQ(run.reports.size(), 6u);
    EXPECT_EQ(arrivedTooEarly, std::vector<std::string>());
}

}  // namespace
