// What the builder writes into patchinfo.xml, read back with the updater's
// own reader.
#include <gtest/gtest.h>

#include <filesystem>
#include <map>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "patch/patch_info_file.h"
#include "tests/support/test_files.h"
#include "tests/tools/tree_maker.h"
#include "tools/publisher/patch_builder.h"

namespace {

using Items = std::vector<std::string>;

struct ReadBack {
    Items diff, diffArchives, added, addedArchives, deleted, deletedFolders, newFolders;
    int32_t count = 0;
};

ReadBack Read(const std::string& folder, PatchInfoFile& info) {
    info.Load(PathJoin(folder, "patchinfo.xml"));
    info.ResetIterators();
    ReadBack result;
    std::string path, archive;
    while (info.NextDiffFile(path, archive)) {
        result.diff.push_back(path);
        result.diffArchives.push_back(archive);
    }
    while (info.NextNewFile(path, archive)) {
        result.added.push_back(path);
        result.addedArchives.push_back(archive);
    }
    while (info.NextDeletedFile(path)) result.deleted.push_back(path);
    while (info.NextDeletedDirectory(path)) result.deletedFolders.push_back(path);
    while (info.NextNewDirectory(path)) result.newFolders.push_back(path);
    result.count = info.CountFileAndDirectoryChanges();
    return result;
}

int64_t FileSize(const std::string& path) {
    FileStream file;
    file.Open(path);
    return file.GetLength();
}

void MakeKnownPair(const TempFolder& temp) {
    for (const char* root : {"old", "new"}) {
        std::filesystem::create_directories(temp / root);
        WriteTextFile(PathJoin(temp / root, "same.txt"), "unchanged");
        std::filesystem::create_directories(PathJoin(temp / root, "data"));
    }
    WriteTextFile(PathJoin(temp / "old", "game.exe"), std::string(5000, 'a') + "old tail");
    WriteTextFile(PathJoin(temp / "new", "game.exe"), std::string(5000, 'a') + "new tail, longer");
    WriteTextFile(PathJoin(temp / "old", "data/level.pak"), "level one");
    WriteTextFile(PathJoin(temp / "new", "data/level.pak"), "level two");  // same size, other bytes
    WriteTextFile(PathJoin(temp / "old", "readme.txt"), "going away");
    std::filesystem::create_directories(PathJoin(temp / "old", "old_mods/inner"));
    WriteTextFile(PathJoin(temp / "old", "old_mods/inner/mod.dat"), "mod");
    std::filesystem::create_directories(PathJoin(temp / "new", "maps/north"));
    WriteTextFile(PathJoin(temp / "new", "maps/north/map.dat"), std::string(3000, 'm'));
    WriteTextFile(PathJoin(temp / "new", "data/extra.pak"), "extra");
    WriteTextFile(PathJoin(temp / "new", "notes.txt"), "");
    std::filesystem::create_directories(PathJoin(temp / "new", "saves"));
}

TEST(PatchDescription, ListsEveryChangeInOrderWithRegistryAndSpace) {
    if (!CanRunXdelta3()) GTEST_SKIP() << "the xdelta3 program cannot be run here (deltas are made natively)";
    TempFolder temp;
    MakeKnownPair(temp);
    BuildOptions options;
    options.fromDir = temp / "old";
    options.toDir = temp / "new";
    options.version = "3";
    options.outDir = temp / "out";
    options.maxArchiveSize = 1;  // one member per archive
    options.registryPath = "SOFTWARE\\Studio\\Game";
    options.hive = RegistryHive::CurrentUser;
    const std::string patch = BuildPatch(options);

    PatchInfoFile info;
    const ReadBack items = Read(patch, info);
    EXPECT_EQ((Items{"data\\level.pak", "game.exe"}), items.diff);
    EXPECT_EQ((Items{"data\\extra.pak", "maps\\north\\map.dat", "notes.txt"}), items.added);
    EXPECT_EQ((Items{"old_mods\\inner\\mod.dat", "readme.txt"}), items.deleted);
    EXPECT_EQ((Items{"old_mods\\inner", "old_mods"}), items.deletedFolders);
    EXPECT_EQ((Items{"maps", "maps\\north", "saves"}), items.newFolders);
    EXPECT_EQ(12, items.count);
    // What the applier needs first is in the first archive, and so on.
    EXPECT_EQ((Items{"patch0.lzma", "patch1.lzma"}), items.diffArchives);
    EXPECT_EQ((Items{"patch2.lzma", "patch3.lzma", "patch4.lzma"}), items.addedArchives);
    EXPECT_FALSE(PathExists(PathJoin(patch, "patch5.lzma")));
    EXPECT_EQ(RegistryHive::CurrentUser, info.GetHive());
    EXPECT_EQ("SOFTWARE\\Studio\\Game", info.GetRegistryPath());

    // Archives plus every file written, plus at most the largest delta.
    int64_t archives = 0;
    for (int i = 0; i < 5; ++i) archives += FileSize(PathJoin(patch, "patch" + std::to_string(i) + ".lzma"));
    const int64_t files = 9 + 5016 + 5 + 3000 + 0;
    EXPECT_GE(info.GetSpaceRequirement(), archives + files);
    EXPECT_LT(info.GetSpaceRequirement(), archives + files + 5016);
}

TEST(PatchDescription, CompleteBuildHoldsEveryFileAndFolderInOneArchive) {
    TempFolder temp;
    MakeKnownPair(temp);
    BuildOptions options;
    options.toDir = temp / "new";
    options.version = "3";
    options.outDir = temp / "out";
    const std::string build = BuildPatch(options);
    PatchInfoFile info;
    const ReadBack items = Read(build, info);
    EXPECT_TRUE(items.diff.empty());
    EXPECT_EQ(
        (Items{"data\\extra.pak", "data\\level.pak", "game.exe", "maps\\north\\map.dat", "notes.txt", "same.txt"}),
        items.added);
    EXPECT_EQ(Items(6, "patch0.lzma"), items.addedArchives);
    EXPECT_EQ((Items{"data", "maps", "maps\\north", "saves"}), items.newFolders);
    EXPECT_TRUE(items.deleted.empty() && items.deletedFolders.empty());
    EXPECT_EQ(RegistryHive::LocalMachine, info.GetHive());
    EXPECT_EQ("SOFTWARE\\Halvard\\Ironvale", info.GetRegistryPath());
}

TEST(BuildErrors, UnusableInputsFailClearlyAndLeaveNothing) {
    TempFolder temp;
    std::filesystem::create_directories(temp / "tree");
    WriteTextFile(PathJoin(temp / "tree", "a.txt"), "a");
    struct Case {
        const char* what;
        std::string from, to, version, xdelta3, expected, out;
    } cases[] = {
        {"missing old tree", temp / "nowhere", temp / "tree", "2", "xdelta3", "Not a readable folder", ""},
        {"missing new tree", "", temp / "nowhere", "2", "xdelta3", "Not a readable folder", ""},
        {"missing xdelta3", temp / "tree", temp / "tree", "2", "no-such-xdelta3-here", "xdelta3", ""},
        {"version with a space", "", temp / "tree", "2 beta", "xdelta3", "Not a usable version", ""},
        {"version with a slash", "", temp / "tree", "../2", "xdelta3", "Not a usable version", ""},
        {"output inside the new tree", "", temp / "tree", "2", "xdelta3", "lies inside the game tree",
         temp / "tree/sub"},
    };
    for (const Case& test : cases) {
        BuildOptions options;
        options.fromDir = test.from;
        options.toDir = test.to;
        options.version = test.version;
        options.outDir = test.out.empty() ? temp / "out" : test.out;
        options.xdelta3 = test.xdelta3;
        try {
            BuildPatch(options);
            ADD_FAILURE() << test.what << ": no exception";
        } catch (const Exception& error) {
            EXPECT_NE(std::string::npos, error.message.find(test.expected)) << test.what << ": " << error.message;
        }
        EXPECT_TRUE(!PathExists(temp / "out") || std::filesystem::is_empty(temp / "out")) << test.what;
    }
}

}  // namespace
