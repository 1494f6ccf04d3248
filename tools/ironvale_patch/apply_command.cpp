// ironvale-patch apply PATCH_DIR INSTALL_DIR: both patch stages as the
// updater runs them, with the archives fetched from PATCH_DIR through the
// downloader's file:// copy. For publishers to try a patch on a copy of an
// installation, and for the applier's benchmark.
#include <cstdio>
#include <filesystem>
#include <list>
#include <string>
#include <vector>

#include "net/http_downloader.h"
#include "patch/exception.h"
#include "patch/file_operations.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/paths.h"
#include "patch/relative_path.h"
#include "tools/ironvale_patch/command.h"

namespace {

const char kUsage[] = "apply PATCH_DIR INSTALL_DIR    apply the patch in PATCH_DIR (patchinfo.xml and archives)";

// The archives the description names, each once, in the order of first use.
std::vector<std::string> ArchivesOf(PatchInfoFile& info) {
    std::vector<std::string> archives;
    auto add = [&archives](const std::string& archive) {
        if (!IsContainedRelativePath(archive)) throw Exception("Unsafe archive name: \"" + archive + "\"");
        for (const std::string& known : archives) {
            if (known == archive) return;
        }
        archives.push_back(archive);
    };
    info.ResetIterators();
    std::string path;
    std::string archive;
    while (info.NextDiffFile(path, archive)) add(archive);
    while (info.NextNewFile(path, archive)) add(archive);
    return archives;
}

int Apply(const std::vector<std::string>& args) {
    if (args.size() != 2) return UsageError(kUsage);
    const std::string patchDir = std::filesystem::absolute(args[0]).string();
    const std::string installation = std::filesystem::absolute(args[1]).string();
    const std::string downloads = installation + ".download";
    const std::string patchedFiles = installation + ".patched";
    if (!MakeDirectories(downloads) || !MakeDirectories(patchedFiles)) {
        throw Exception("Cannot create the work folders beside " + installation);
    }

    PatchInfoFile info;
    info.Load(PathJoin(patchDir, "patchinfo.xml"));
    std::list<DownloadEntry> list;
    for (const std::string& archive : ArchivesOf(info)) {
        list.emplace_back("file://" + PathJoin(patchDir, archive), PathJoin(downloads, archive));
    }
    PatchProgressFile progress;
    progress.SetDirectory(installation);
    HttpDownloader downloader;
    PatchApplier applier;
    applier.Init(&info, &progress, installation, patchedFiles, downloads, nullptr, &downloader);
    if (!list.empty()) downloader.Start(list, false);
    applier.PreparePatch();

    progress.SetPatchPath(downloads);
    progress.SetPatchedFilesPath(patchedFiles);
    progress.SetPatchUri(patchDir);
    progress.SetActionIndex(-1);
    progress.SetFile("");
    progress.WriteRecord();
    applier.ApplyPatch();
    RemoveFile(progress.GetRecordPath());
    DeleteDirectory(downloads, true);
    DeleteDirectory(patchedFiles, true);
    return 0;
}

const CommandRegistration registration("apply", kUsage, &Apply);

}  // namespace
