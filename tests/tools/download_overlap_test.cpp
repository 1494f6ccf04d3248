// Stage one works on each archive as soon as it has arrived, while the
// downloader still fetches the next ones from a slow server.
#include <gtest/gtest.h>

#include "base/paths.h"
#include "net/http_downloader.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/http_test_server.h"

namespace {

TEST(DownloadOverlap, EachArchiveIsPreparedWhileTheNextOneDownloads) {
    // Archive "k.dat" holds the delta of "k/diffk" and a large new file, so
    // it takes a while to arrive at the server's pace.
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
    // The diffs come first, one per archive: each is reached (those before
    // it rebuilt) while its archive is still on its way.
    int early = 0;                                 // diffs reached after their archive had arrived
    run.onReport = [&](const std::string& name) {  // "diffk": has "k.dat" arrived?
        for (const DownloadEntry& entry : downloader.Entries()) {
            early += GetFileName(entry.localPath) == name.substr(4) + ".dat" && entry.status == DownloadStatus::Done;
        }
    };
    downloader.Start(MakeDownloadList(ArchivesInFetchOrder(run.info), server.Url("/patch"), downloads.Path()), false);
    run.stages.Prepare(run.work, &downloader, &run);
    run.Apply();
    EXPECT_EQ(ReadTree(batch.Installation()), target);
    EXPECT_EQ(run.reports.size(), 6u);
    EXPECT_EQ(early, 0);
    EXPECT_EQ(downloader.WaitForArchive("not in the list"), ArchiveState::Failed);  // rather than wait for ever
}

}  // namespace
