// The run's one decision: from what it found, the road and the batch it installs.
#include <gtest/gtest.h>

#include "app/update_plan.h"
#include "base/exception.h"
#include "base/paths.h"

namespace {

const UpdateLayout kLayout{"Game", PathJoin("Game", "tempPatch"), PathJoin("Game", "tempPatch/patched"), "http://host",
                           "http://builds"};

struct Case {
    const char* installed;
    const char* patcher;
    const char* latest;
    InterruptedBatch::Kind interrupted;
    Road road;                    // when it does not throw
    const char* location;         // of the batch
    ErrorCode error;              // None: no throw
    bool foreignFolders = false;  // the record names work folders beside the program's
    bool descriptionFits = true;
};

TEST(UpdatePlan, DecidesTheRoadAndItsBatch) {
    using Kind = InterruptedBatch::Kind;
    const char* const patch2 = "http://host/patch_515195_2";
    const char* const build2 = "http://builds/build_2";
    const Case cases[] = {
        {"1", "3", "2", Kind::None, Road::Patch, patch2, ErrorCode::None},
        {"2", "3", "2", Kind::None, Road::UpToDate, "", ErrorCode::None},
        // Whole numbers and dotted whole numbers compare number by number, everything else byte-wise.
        {"9", "3", "10", Kind::None, Road::Patch, "http://host/patch_515195_10", ErrorCode::None},
        {"10", "3", "9", Kind::None, Road::UpToDate, "", ErrorCode::None},
        {"1000", "3", "999", Kind::None, Road::UpToDate, "", ErrorCode::None},
        {"007", "3", "7", Kind::None, Road::UpToDate, "", ErrorCode::None},
        {"1.9", "3", "1.10", Kind::None, Road::Patch, "http://host/patch_515195_1.10", ErrorCode::None},
        {"1.10", "3", "1.9", Kind::None, Road::UpToDate, "", ErrorCode::None},
        {"1.10", "3", "2", Kind::None, Road::Patch, "http://host/patch_515195_2", ErrorCode::None},
        {"2.0", "3", "2", Kind::None, Road::UpToDate, "", ErrorCode::None},
        {"beta", "3", "gamma", Kind::None, Road::Patch, "http://host/patch_515195_gamma", ErrorCode::None},
        {"10", "3", "9a", Kind::None, Road::Patch, "http://host/patch_515195_9a", ErrorCode::None},
        {"", "3", "2", Kind::None, Road::UpToDate, "", ErrorCode::NoLocalVersion},
        // An interrupted stage two: its record, or the complete build when the record is lost, names work folders
        // other than the program's, or its description does not fit it.
        {"-1", "3", "3", Kind::Resume, Road::Resume, "http://host/patch_515195_2", ErrorCode::None},
        {"-1", "3", "2", Kind::Reinstall, Road::Reinstall, build2, ErrorCode::None},
        {"-1", "3", "2", Kind::Resume, Road::Reinstall, build2, ErrorCode::None, true},
        {"-1", "3", "2", Kind::Resume, Road::Reinstall, build2, ErrorCode::None, false, false},
        // The updater that recorded the installation: older or unreadable (1.0), newer.
        {"1", "3.0", "2", Kind::None, Road::Patch, patch2, ErrorCode::None},
        {"1", "2.5", "2", Kind::None, Road::UpToDate, "", ErrorCode::CorruptData},
        {"1", "three", "2", Kind::None, Road::UpToDate, "", ErrorCode::CorruptData},
        {"-1", "3.5", "2", Kind::Resume, Road::UpToDate, "", ErrorCode::NewerInstaller},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.installed) + " -> " + c.latest);
        UpdateFacts facts;
        facts.installedVersion = c.installed;
        facts.patcherVersion = c.patcher;
        facts.latestVersion = c.latest;
        facts.interrupted.kind = c.interrupted;
        const std::string work = c.foreignFolders ? PathJoin("Documents", "tempPatch") : kLayout.patchFolder;
        facts.interrupted.batch = {"", work, PathJoin(work, "patched"), "http://host/patch_515195_2", "2"};
        facts.interrupted.resumeAt = {4, "data\\old.pak"};
        facts.recordedDescriptionFits = c.descriptionFits;
        try {
            const UpdatePlan plan = PlanUpdate(facts, kLayout);
            EXPECT_EQ(c.error, ErrorCode::None);
            EXPECT_EQ(plan.road, c.road);
            EXPECT_EQ(plan.batch.location, c.location);
            EXPECT_EQ(plan.completeBuild.location, std::string("http://builds/build_") + c.latest);
            if (c.road == Road::UpToDate) continue;
            EXPECT_EQ(plan.batch.installationFolder, kLayout.installationFolder);
            if (c.road == Road::Resume) {
                EXPECT_EQ(plan.batch.version, "2");  // the record's, not the server's
                EXPECT_EQ(plan.resumeAt.actionIndex, 4);
                EXPECT_EQ(plan.resumeAt.file, "data\\old.pak");
            } else {
                EXPECT_EQ(plan.batch.version, c.latest);
            }
            // Whatever a record names, the work happens in the program's own folders.
            EXPECT_EQ(plan.batch.patchFolder, kLayout.patchFolder);
            EXPECT_EQ(plan.batch.patchedFilesFolder, kLayout.patchedFilesFolder);
        } catch (const Exception& error) {
            EXPECT_EQ(error.Code(), c.error) << error.message;
        }
    }
}

}  // namespace
