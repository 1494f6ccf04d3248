#include "tests/patch/stage_two_fixture.h"

#include <stdexcept>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/test_files.h"

namespace {

void Put(const std::string& root, const std::string& relative, const std::string& content) {
    const std::string path = PathJoin(root, relative);
    MakeDirectories(GetParentDirectory(path));
    WriteTextFile(path, content);
}

const char kPatchInfo[] = R"(<?xml version="1.0" ?>
<IronvaleWestPatch>
    <FileChanges>
        <delete Path="remove me.txt" />
        <delete Path="sub\gone.dat" />
        <delete Path="already gone.txt" />
    </FileChanges>
    <DirectoryChanges>
        <delete Path="old" />
        <delete Path="cfg" />
        <new Path="cfg" />
        <new Path="data" />
        <new Path="data\nested deep" />
    </DirectoryChanges>
</IronvaleWestPatch>
)";

}  // namespace

int StageTwoActionCount() { return 8; }

bool RunStageTwo(const StageTwoBatch& batch, IStatusView* view) {
    // The installed version says where a run stands: the old one before the
    // batch, "-1" while it is under way, the new one once it is done.
    const std::string versionFile = PathJoin(batch.installation, kVersionFile);
    if (ReadTextFile(versionFile) == "2") {
        // Stopped between storing the new version and removing the record:
        // the batch is complete and the record a leftover.
        RemoveFile(PathJoin(batch.installation, "PPF.xml"));
        return true;
    }
    PatchInfoFile info;
    info.Load(batch.patchInfo);
    PatchProgressFile progress;
    progress.SetDirectory(batch.installation);
    try {
        progress.resuming = progress.Recover();
    } catch (const Exception& error) {
        // Only a record cut short while it was first written is unreadable:
        // no action had been carried out, so the batch starts afresh here
        // (the updater reinstalls the complete build instead).
        if (error.Code() != ErrorCode::ReinstallRequired) throw;
    }
    PatchApplier applier;
    PatchStages stages(info, progress, applier);
    const PatchBatch work{batch.installation, batch.patchFolder, batch.patchedFiles, "", "2"};
    try {
        stages.Apply(work, view, [&versionFile](const std::string& version) { WriteTextFile(versionFile, version); });
    } catch (const std::runtime_error&) {
        return false;
    }
    return true;
}

StageTwoBatch MakeStageTwoBatch(const std::string& root) {
    StageTwoBatch batch;
    batch.installation = PathJoin(root, "Ironvale");
    batch.patchFolder = PathJoin(batch.installation, "tempPatch");
    batch.patchedFiles = PathJoin(batch.patchFolder, "patched");
    batch.patchInfo = PathJoin(batch.patchFolder, "patchinfo.xml");

    const std::string& game = batch.installation;
    Put(game, "game.exe", "old game");
    Put(game, "remove me.txt", "x");
    Put(game, "sub\\gone.dat", "y");
    Put(game, "sub\\kept.dat", "kept");
    Put(game, "old\\a.txt", "a");
    Put(game, "old\\deeper\\b.txt", "b");
    Put(game, "cfg\\stale.ini", "stale");
    Put(game, "cfg\\user.ini", "old settings");

    const std::string& prepared = batch.patchedFiles;
    Put(prepared, "game.exe", "new game");
    Put(prepared, "cfg\\user.ini", "new settings");
    Put(prepared, "data\\nested deep\\level.bin", std::string("\0\1\2", 3));
    Put(prepared, "data\\empty.txt", "");
    Put(prepared, "readme.txt", "new readme");
    WriteTextFile(batch.patchInfo, kPatchInfo);
    WriteTextFile(PathJoin(game, kVersionFile), "1");
    return batch;
}

std::map<std::string, std::string> ListTree(const std::string& folder) {
    // The updater's own work folder and version record are not part of the
    // game's files.
    const Tree read = ReadTree(folder);
    std::map<std::string, std::string> tree;
    const auto isOwn = [](const std::string& path) {
        return path == kVersionFile || path == "tempPatch" || path.rfind("tempPatch/", 0) == 0;
    };
    for (const std::string& path : read.folders) {
        if (!isOwn(path)) tree[path] = "<dir>";
    }
    for (const auto& file : read.files) {
        if (!isOwn(file.first)) tree[file.first] = file.second;
    }
    return tree;
}

std::map<std::string, std::string> ExpectedTree() {
    return {
        {"game.exe", "new game"},
        {"sub", "<dir>"},
        {"sub/kept.dat", "kept"},
        {"cfg", "<dir>"},
        {"cfg/user.ini", "new settings"},
        {"data", "<dir>"},
        {"data/empty.txt", ""},
        {"data/nested deep", "<dir>"},
        {"data/nested deep/level.bin", std::string("\0\1\2", 3)},
        {"readme.txt", "new readme"},
    };
}
