// Ways stage one and stage two end early: a cancel, a missing installed
// file, a hostile description. Each must leave the installation as it was.

#include <gtest/gtest.h>

#include <ostream>

#include <cstdio>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/http_test_server.h"

namespace {

Tree SmallInstallation() {
    return Tree().File("keep.txt", "keep").File("data/a.bin", SeededBytes(4000, 1)).File("data/b.bin", "bee");
}

Tree SmallTarget() {
    return Tree()
        .File("keep.txt", "keep")
        .File("data/a.bin", SeededBytes(4000, 1) + "more")
        .File("data/new.bin", SeededBytes(3000, 2))
        .Folder("made");
}

// Asks the applier to cancel when it reports its first item, that is
// while it works on it (before the item's archive is even waited for).
class CancelOnFirstItem final : public IStatusView {
public:
    PatchApplier* applier = nullptr;
    void OnApplyProgress(const std::string&, int32_t) override { applier->RequestCancel(); }
    void OnFileProgress(const std::string&, uint32_t, uint32_t) override {}
    void OnFileDone(const std::string&) override {}
};

// The updater's cancel while stage one waits: the applier's flag and a
// stop of the downloader, from the downloader's thread once bytes flow.
class CancelWhileDownloading final : public IStatusView {
public:
    BatchRun* run = nullptr;
    void OnApplyProgress(const std::string&, int32_t) override {}
    void OnFileProgress(const std::string&, uint32_t done, uint32_t) override {
        if (done == 0) return;
        run->applier.RequestCancel();
        run->downloader.RequestStop();
    }
    void OnFileDone(const std::string&) override {}
};

TEST(ApplierCancel, DuringPreparationEndsWithUserCancelledAndNoText) {
    TestBatch batch(SmallInstallation(), SmallTarget());
    CancelOnFirstItem view;
    BatchRun run(batch, &view);
    view.applier = &run.applier;
    run.StartFileDownloads();
    try {
        run.Prepare();
        FAIL() << "no cancel";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::UserCancelled);
        EXPECT_EQ(error.message, "");
    }
    EXPECT_EQ(ReadTree(batch.Installation()).files, SmallInstallation().files);
}

TEST(ApplierCancel, WhileWaitingForAnArchiveEndsWithUserCancelledAndNoText) {
    TestBatch batch(SmallInstallation(), SmallTarget());
    HttpTestServer server;
    HttpTestResponse slow;
    slow.pieceSize = 64;
    slow.pause = std::chrono::milliseconds(50);
    server.ServeFolder("/patch/", batch.Served(), slow);

    CancelWhileDownloading view;
    BatchRun run(batch);
    view.run = &run;
    run.downloader.SetStatusView(&view);
    std::list<DownloadEntry> list;
    for (const std::string& archive : batch.Archives()) {
        list.emplace_back(server.Url("/patch/" + archive), PathJoin(batch.PatchFolder(), archive));
    }
    run.downloader.Start(list, false);
    try {
        run.Prepare();
        FAIL() << "no cancel";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::UserCancelled);
        EXPECT_EQ(error.message, "");
    }
    EXPECT_EQ(ReadTree(batch.Installation()).files, SmallInstallation().files);
}

TEST(ApplierFailure, MissingInstalledFileNamesDeltaSourceAndOpenFailure) {
    TestBatch batch(SmallInstallation(), SmallTarget());
    const std::string installed = PathJoin(batch.Installation(), "data\\a.bin");
    std::remove(installed.c_str());
    const std::string delta = PathJoin(batch.PatchFolder(), "diffTempFile.dz");
    try {
        batch.Apply();
        FAIL() << "no failure";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::DeltaFailed);
        EXPECT_EQ(error.message, "Failed to apply delta file " + delta + " on " + installed +
                                     ". Source message: Failed to open file: " + installed);
    }
    EXPECT_FALSE(PathExists(PathJoin(batch.Installation(), "made")));
}

TEST(ApplierFailure, FailedDownloadEndsWithFileNotFound) {
    TestBatch batch(SmallInstallation(), SmallTarget());
    std::remove(PathJoin(batch.Served(), batch.Archives().front()).c_str());
    try {
        batch.Apply();
        FAIL() << "no failure";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::FileNotFound);
        EXPECT_EQ(error.message, "Failed to download patch file.");
    }
}

// A hostile item placed after harmless ones: the whole description is
// refused before the first item changes anything.
struct HostileItem {
    const char* name;
    PatchItem item;
};

const HostileItem kHostileItems[] = {
    {"DeleteParent", {"FileChanges", "delete", "..\\outside.txt", ""}},
    {"DeleteParentForwardSlash", {"FileChanges", "delete", "data/../../outside.txt", ""}},
    {"DeleteRooted", {"FileChanges", "delete", "\\outside.txt", ""}},
    {"DeleteDriveLetter", {"FileChanges", "delete", "C:outside.txt", ""}},
    {"DeleteUnc", {"FileChanges", "delete", "\\\\host\\share\\outside.txt", ""}},
    {"NewEscapes", {"FileChanges", "new", "..\\outside.txt", "patch1.dat"}},
    {"DiffEscapes", {"FileChanges", "diff", "..\\..\\x.bin", "patch1.dat"}},
    {"ArchiveEscapes", {"FileChanges", "new", "data\\c.bin", "..\\served\\patch1.dat"}},
    {"DeleteFolderEscapes", {"DirectoryChanges", "delete", "..", ""}},
    {"NewFolderEscapes", {"DirectoryChanges", "new", "..\\elsewhere", ""}},
    {"EmptyPath", {"DirectoryChanges", "delete", "", ""}},
};

// Failures name the case, not its bytes.
void PrintTo(const HostileItem& value, std::ostream* out) { *out << value.name; }

class HostileDescription : public ::testing::TestWithParam<HostileItem> {};

TEST_P(HostileDescription, IsRefusedInBothStagesBeforeAnythingChanges) {
    TestBatch batch(SmallInstallation(), SmallTarget());
    const std::string outside = PathJoin(batch.Installation(), "..\\outside.txt");
    WriteTextFile(outside, "must stay");
    std::vector<PatchItem> items = batch.Items();
    items.push_back({"FileChanges", "delete", "keep.txt", ""});
    items.push_back(GetParam().item);
    batch.ReplaceItems(items);

    for (const bool stageTwo : {false, true}) {
        SCOPED_TRACE(stageTwo ? "stage two" : "stage one");
        BatchRun run(batch);
        run.StartFileDownloads();
        try {
            stageTwo ? run.ApplyStageTwo() : run.Prepare();
            FAIL() << "accepted";
        } catch (const Exception& error) {
            EXPECT_EQ(error.code, 0);
            EXPECT_NE(error.message.find("Unsafe path"), std::string::npos) << error.message;
        }
        EXPECT_EQ(ReadTree(batch.Installation()).files, SmallInstallation().files);
        EXPECT_TRUE(FilesBelow(batch.PatchedFiles()).empty());
        EXPECT_EQ(ReadTextFile(outside), "must stay");
    }
}

INSTANTIATE_TEST_SUITE_P(Items, HostileDescription, ::testing::ValuesIn(kHostileItems),
                         [](const ::testing::TestParamInfo<HostileItem>& param) { return param.param.name; });

}  // namespace
