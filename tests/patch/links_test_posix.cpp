// A link inside the installation is never followed: an item whose path passes through one is refused before anything
// changes, a deleted folder that is a link goes itself, and the work folders may not be links.
#include <gtest/gtest.h>
#include <unistd.h>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"

namespace {

TEST(Links, AreNeverFollowed) {
    const Tree installed = TreeOf("game.exe=old|data/a.txt=a");
    const Tree target = TreeOf("game.exe=new|data/a.txt=a");
    const struct {
        const char* link;  // in the installation, to the folder outside
        std::function<void(PatchDescription&)> items;
        bool refused;
    } cases[] = {
        {"textures", [](PatchDescription& d) { d.deletedFiles.push_back("textures\\keep.txt"); }, true},
        {"data/world", [](PatchDescription& d) { d.newDirectories.push_back("data\\world\\maps"); }, true},
        {"linked", [](PatchDescription& d) { d.deletedDirectories.push_back("linked"); }, false},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.link);
        TestBatch batch(installed, target);
        c.items(batch.description);
        batch.WriteInfo();
        const std::string outside = batch.Root() + "/outside";
        WriteTree(outside, TreeOf("keep.txt=the player's"));
        ASSERT_EQ(symlink(outside.c_str(), PathJoin(batch.Installation(), c.link).c_str()), 0);
        const Tree before = ReadTree(batch.Installation());
        BatchRun run(batch);
        const std::string error = ErrorOf([&] {
            run.Prepare();
            run.Apply();
        });
        EXPECT_EQ(error.find("passes through the link") != std::string::npos, c.refused) << error;
        if (c.refused) {
            EXPECT_EQ(ReadTree(batch.Installation()), before);
        } else {
            EXPECT_FALSE(PathExists(PathJoin(batch.Installation(), c.link)));
        }
        EXPECT_EQ(ReadTree(outside), TreeOf("keep.txt=the player's"));
    }
    // A work folder that is a link is refused too.
    TestBatch batch(installed, target);
    BatchRun run(batch);
    ASSERT_EQ(symlink(run.work.patchedFilesFolder.c_str(), PathJoin(batch.Installation(), "tempPatch").c_str()), 0);
    run.work.patchedFilesFolder = PathJoin(batch.Installation(), "tempPatch");
    EXPECT_NE(ErrorOf([&] { run.Prepare(); }).find("is a link"), std::string::npos);
}

}  // namespace
