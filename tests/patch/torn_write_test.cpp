// A record write interrupted at any point leaves a readable record: the
// new one if the rename happened, the previous one otherwise.
#include <gtest/gtest.h>

#include <chrono>
#include <iostream>
#include <random>
#include <string>
#include <thread>

#include "base/paths.h"
#include "patch/patch_progress_file.h"
#include "tests/patch/record_writer_process.h"
#include "tests/support/test_files.h"

namespace {

// Long enough that the record spans several disk blocks.
const std::string kPatchPath = "C:\\Game\\Patch\\" + std::string(6000, 'p');

void FillRecord(PatchProgressFile& record, int32_t action) {
    record.SetPatchPath(kPatchPath);
    record.SetPatchedFilesPath("C:\\Game\\Patch\\Patched");
    record.SetPatchUri("http://host/patch/");
    record.SetVersion("2");
    record.SetActionIndex(action);
    record.SetFile("file-" + std::to_string(action));
}

// Recover must find a complete record, consistent in every field.
void ExpectConsistentRecord(const std::string& folder) {
    PatchProgressFile recovered;
    recovered.SetDirectory(folder);
    ASSERT_TRUE(recovered.Recover());
    EXPECT_EQ(recovered.GetPatchPath(), kPatchPath);
    EXPECT_EQ(recovered.GetVersion(), "2");
    EXPECT_EQ(recovered.GetFile(), "file-" + std::to_string(recovered.GetActionIndex()));
    EXPECT_FALSE(PathExists(PathJoin(folder, "_PPF.xml")));
}

}  // namespace

[[noreturn]] void WriteRecordsForever(const std::string& folder) {
    PatchProgressFile record;
    record.SetDirectory(folder);
    for (int32_t action = 0;; ++action) {
        FillRecord(record, action);
        record.WriteRecord();
    }
}

namespace {

// The state a power cut leaves after k bytes of the new record reached
// the temporary file: every k is tried.
TEST(TornWrite, EveryPrefixOfAnUnfinishedRecordLeavesThePreviousOne) {
    TempFolder scratch;
    PatchProgressFile next;
    next.SetDirectory(scratch.Path());
    FillRecord(next, 2);
    ASSERT_TRUE(next.WriteRecord());
    const std::string newRecord = ReadTextFile(scratch / "PPF.xml");

    TempFolder folder;
    PatchProgressFile record;
    record.SetDirectory(folder.Path());
    FillRecord(record, 1);
    ASSERT_TRUE(record.WriteRecord());
    const std::string oldRecord = ReadTextFile(folder / "PPF.xml");
    for (size_t k = 0; k <= newRecord.size(); k += (k < 64 ? 1 : 97)) {
        SCOPED_TRACE(k);
        WriteTextFile(folder / "PPF.xml", oldRecord);
        WriteTextFile(folder / "_PPF.xml", newRecord.substr(0, k));
        PatchProgressFile recovered;
        recovered.SetDirectory(folder.Path());
        ASSERT_TRUE(recovered.Recover());
        EXPECT_EQ(recovered.GetActionIndex(), 1);
        EXPECT_FALSE(PathExists(folder / "_PPF.xml"));
    }
}

TEST(TornWrite, KillingTheWriterAtAnyMomentLeavesAReadableRecord) {
    TempFolder folder;
    std::mt19937 random(20240611);
    std::uniform_int_distribution<int> pause(0, 4000);
    int tornWrites = 0;
    const int rounds = 60;
    for (int round = 0; round < rounds; ++round) {
        SCOPED_TRACE(round);
        {
            RecordWriterProcess writer(folder.Path());
            for (int wait = 0; wait < 2000 && !PathExists(folder / "PPF.xml"); ++wait) {
                std::this_thread::sleep_for(std::chrono::milliseconds(5));
            }
            ASSERT_TRUE(PathExists(folder / "PPF.xml")) << "the writer never wrote";
            std::this_thread::sleep_for(std::chrono::microseconds(pause(random)));
        }
        if (PathExists(folder / "_PPF.xml")) ++tornWrites;
        ExpectConsistentRecord(folder.Path());
        if (HasFatalFailure()) return;
    }
    std::cout << "[          ] " << tornWrites << " of " << rounds << " kills hit a write in progress\n";
}

}  // namespace
