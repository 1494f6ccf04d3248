// Stage one works on each archive as soon as it has arrived, while the
// downloader is still fetching the next ones from a slow server.

#include <gtest/gtest.h>

#include <algorithm>
#include <mutex>

#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/http_test_server.h"

namespace {

// The downloader's and the applier's reports in the one order they came.
class Timeline final : public IStatusView {
public:
    void OnApplyProgress(const std::string& fileName, int32_t) override { Add("apply " + fileName); }
    void OnFileProgress(const std::string&, uint32_t, uint32_t) override {}
    void OnFileDone(const std::string& localPath) override { Add("done " + GetFileName(localPath)); }

    std::vector<std::string> Events() const {
        std::lock_guard<std::mutex> lock(mutex);
        return events;
    }
    size_t IndexOf(const std::string& event) const {
        const std::vector<std::string> all = Events();
        return static_cast<size_t>(std::find(all.begin(), all.end(), event) - all.begin());
    }

private:
    void Add(const std::string& event) {
        std::lock_guard<std::mutex> lock(mutex);
        events.push_back(event);
    }
    mutable std::mutex mutex;
    std::vector<std::string> events;
};

TEST(DownloadOverlap, EachArchiveIsPreparedWhileTheNextOneDownloads) {
    // Archive k holds the delta of "kN.dat" and a large incompressible new
    // file, so each archive takes a while to arrive at the server's pace.
    Tree installed;
    Tree target;
    for (int k = 1; k <= 3; ++k) {
        const std::string old = SeededBytes(5000, k);
        installed.File("k" + std::to_string(k) + ".dat", old);
        target.File("k" + std::to_string(k) + ".dat", old.substr(0, 4000) + "changed tail");
        target.File("k" + std::to_string(k) + "-bulk.bin", SeededBytes(48 * 1024, 10 + k));
    }
    TestBatch batch(installed, target, [](const std::string& path) { return "archive" + path.substr(1, 1) + ".dat"; });
    ASSERT_EQ(batch.Archives(), (std::vector<std::string>{"archive1.dat", "archive2.dat", "archive3.dat"}));

    HttpTestServer server;
    HttpTestResponse slow;
    slow.pieceSize = 4096;
    slow.pause = std::chrono::milliseconds(25);
    server.ServeFolder("/patch/", batch.Served(), slow);

    Timeline timeline;
    BatchRun run(batch, &timeline);
    run.downloader.SetStatusView(&timeline);
    std::list<DownloadEntry> list;
    for (const std::string& archive : batch.Archives()) {
        list.emplace_back(server.Url("/patch/" + archive), PathJoin(batch.PatchFolder(), archive));
    }
    run.downloader.Start(list, false);
    ASSERT_NO_THROW(run.Prepare());
    ASSERT_NO_THROW(run.ApplyStageTwo());
    EXPECT_EQ(ReadTree(batch.Installation()).files, target.files);

    // The diffs come first, one per archive in list order: reaching the
    // diff of archive k+1 means the one of archive k is rebuilt, and that
    // must happen before archive k+1 has finished arriving.
    const std::vector<std::string> events = timeline.Events();
    std::string order;
    for (const std::string& event : events) order += event + "; ";
    for (int k = 1; k <= 2; ++k) {
        const std::string next = std::to_string(k + 1);
        EXPECT_LT(timeline.IndexOf("done archive" + std::to_string(k) + ".dat"),
                  timeline.IndexOf("done archive" + next + ".dat"))
            << order;
        EXPECT_LT(timeline.IndexOf("apply k" + next + ".dat"), timeline.IndexOf("done archive" + next + ".dat"))
            << order;
    }
    EXPECT_LT(timeline.IndexOf("done archive3.dat"), events.size()) << order;
}

}  // namespace
