#include <gtest/gtest.h>

#include "base/atomic_file.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "tests/support/test_files.h"

namespace {

TEST(AtomicFileTest, ReplacesWholeAndLeavesNoTemporary) {
    TempFolder folder;
    const std::string path = folder / "record.xml";
    WriteTextFile(path, "old content that is longer");
    EXPECT_TRUE(ReplaceFileAtomically(path, "new"));
    EXPECT_EQ(ReadTextFile(path), "new");
    EXPECT_FALSE(PathExists(folder / "~record.xml.tmp"));
    EXPECT_TRUE(ReplaceFileAtomically(folder / "fresh.xml", ""));
    EXPECT_EQ(ReadTextFile(folder / "fresh.xml"), "");
}

TEST(AtomicFileTest, AFailedWriteKeepsTheOldFile) {
    TempFolder folder;
    const std::string path = folder / "record.xml";
    WriteTextFile(path, "old");
    // The temporary cannot be made (its folder does not exist).
    EXPECT_FALSE(ReplaceFileAtomically(path, "new", PathJoin(folder / "missing", "tmp")));
    EXPECT_EQ(ReadTextFile(path), "old");
    // The temporary is in use by someone else.
    const std::string busy = folder / "busy.tmp";
    FileStream holder;
    holder.Create(busy);
    EXPECT_FALSE(ReplaceFileAtomically(path, "new", busy));
    EXPECT_EQ(ReadTextFile(path), "old");
}

}  // namespace
