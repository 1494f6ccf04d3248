#include <gtest/gtest.h>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "base/status_interfaces.h"
#include "patch/patch_progress_file.h"
#include "tests/patch/stage_two_fixture.h"
#include "tests/support/test_files.h"

namespace {

// Ends stage two right after a chosen number of recorded actions, the way a
// crash would: the action has happened, nothing after it has.
class Interrupter final : public IStatusView {
public:
    explicit Interrupter(int afterActions) : remaining(afterActions) {}
    void OnApplyProgress(const std::string&, int32_t) override {
        if (--remaining == 0) throw std::runtime_error("interrupted");
    }
    void OnFileProgress(const std::string&, uint32_t, uint32_t) override {}
    void OnFileDone(const std::string&) override {}

private:
    int remaining;
};

TEST(ResumeTest, AnUninterruptedBatchGivesTheTargetAndLeavesNoRecord) {
    TempFolder root;
    const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
    ASSERT_TRUE(RunStageTwo(batch, nullptr));
    EXPECT_EQ(ListTree(batch.installation), ExpectedTree());
    std::vector<std::string> left;
    CollectFiles(batch.patchedFiles, left);
    EXPECT_TRUE(left.empty());
}

TEST(ResumeTest, InterruptedAfterEveryActionTheNextRunFinishesTheBatch) {
    for (int k = 1; k <= StageTwoActionCount(); ++k) {
        TempFolder root;
        const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
        Interrupter interrupter(k);
        ASSERT_FALSE(RunStageTwo(batch, &interrupter)) << "after action " << k;
        ASSERT_TRUE(PathExists(PathJoin(batch.installation, "PPF.xml")));
        ASSERT_TRUE(RunStageTwo(batch, nullptr)) << "after action " << k;
        EXPECT_EQ(ListTree(batch.installation), ExpectedTree()) << "after action " << k;
        EXPECT_FALSE(PathExists(PathJoin(batch.installation, "PPF.xml")));
    }
}

TEST(ResumeTest, ARepeatedPathIsNotMistakenForTheRecordedAction) {
    // "cfg" is deleted and then created anew. Interrupted after the last
    // folder action, with the new settings already moved into cfg: the
    // deletion of cfg must not run again and take them away.
    TempFolder root;
    const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
    Interrupter interrupter(StageTwoActionCount());
    ASSERT_FALSE(RunStageTwo(batch, &interrupter));
    ASSERT_TRUE(MoveFileReplacing(PathJoin(batch.patchedFiles, "cfg\\user.ini"),
                                  PathJoin(batch.installation, "cfg\\user.ini")));
    ASSERT_TRUE(RunStageTwo(batch, nullptr));
    EXPECT_EQ(ListTree(batch.installation), ExpectedTree());
}

TEST(ResumeTest, ARecordNamingNoItemSkipsEveryRecordedActionButMovesEverything) {
    TempFolder root;
    const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
    PatchProgressFile record;
    record.SetDirectory(batch.installation);
    record.SetActionIndex(3);
    record.SetFile("no such item");
    ASSERT_TRUE(record.WriteRecord());
    ASSERT_TRUE(RunStageTwo(batch, nullptr));
    const auto tree = ListTree(batch.installation);
    EXPECT_EQ(tree.at("remove me.txt"), "x");  // not deleted: counted as done
    EXPECT_EQ(tree.at("old/a.txt"), "a");
    EXPECT_EQ(tree.at("game.exe"), "new game");
    EXPECT_EQ(tree.at("data/nested deep/level.bin"), std::string("\0\1\2", 3));
}

TEST(ResumeTest, UnsafePathsAreRefusedBeforeAnythingChanges) {
    for (const char* path : {"..\\outside.txt", "C:\\Windows\\x.dll", "\\\\host\\share\\x", "/etc/passwd",
                             "sub\\..\\..\\x", "a:stream", "..."}) {
        TempFolder root;
        const StageTwoBatch batch = MakeStageTwoBatch(root.Path());
        std::string text = ReadTextFile(batch.patchInfo);
        text.replace(text.find("<new Path=\"data\" />"), 19, std::string("<new Path=\"") + path + "\" />");
        WriteTextFile(batch.patchInfo, text);
        const auto before = ListTree(batch.installation);
        try {
            RunStageTwo(batch, nullptr);
            ADD_FAILURE() << path << " was accepted";
        } catch (const Exception& error) {
            EXPECT_EQ(error.code, 0);
            EXPECT_NE(error.message.find(path), std::string::npos) << error.message;
        }
        EXPECT_EQ(ListTree(batch.installation).count("remove me.txt"), 1u) << path;
        EXPECT_EQ(before.size() + 1, ListTree(batch.installation).size()) << "only the record was added";
    }
}

}  // namespace
