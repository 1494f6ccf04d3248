// Arbitrary names as the items of a description, through the name check and both stages of the applier on a scratch
// installation holding a link to a folder beside it: whatever the names, nothing beside the installation may change,
// and every name the check accepts stays below the folder it is joined to.
#include <filesystem>
#include <vector>

#include "base/archive_source.h"
#include "base/item_path.h"
#include "patch/patch_applier.h"
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "patch/patch_stages.h"
#include "tests/fuzz/fuzz_files.h"
#include "tools/publisher/patch_description.h"

namespace fs = std::filesystem;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::vector<std::string> names(1);
    for (size_t i = 0; i < size && names.size() <= 8; ++i) {
        if (data[i] == '\n') names.emplace_back();
        if (data[i] != '\n' && data[i] != 0) names.back() += static_cast<char>(data[i]);
    }
    const fs::path root = FuzzFolder();
    const fs::path install = root / "install";
    const fs::path outside = root / "outside.txt";
    const fs::path elsewhere = root / "elsewhere";
    for (const std::string& name : names) {
        if (!IsSafeItemPath(name)) continue;
        std::string portable = name;
        for (char& c : portable) c = c == '\\' ? '/' : c;
        const fs::path joined = (install / portable).lexically_normal();
        if (joined.string().rfind(install.string() + "/", 0) != 0) std::abort();
    }

    fs::remove_all(install);
    fs::create_directories(install / "tempPatch" / "patched");
    fs::create_directories(elsewhere);
    fs::create_directory_symlink(elsewhere, install / "linked");
    WriteFuzzFile("outside.txt", data, 0);
    WriteFuzzFile("elsewhere/keep.txt", data, 0);
    WriteFuzzFile("install/game.txt", data, 0);
    // Stage one gets every kind of item (no archive comes), stage two the deletions and folders, which it carries
    // out without anything prepared.
    PatchDescription all, removals;
    for (size_t i = 0; i < names.size(); ++i) {
        if (i % 3 == 0) all.deletedFiles.push_back(names[i]), removals.deletedFiles.push_back(names[i]);
        if (i % 3 != 0) (i % 3 == 1 ? all.newFiles : all.diffFiles).emplace_back(names[i], "p.lzma");
        (i % 2 ? all.newDirectories : all.deletedDirectories).push_back(names[i]);
        (i % 2 ? removals.newDirectories : removals.deletedDirectories).push_back(names[i]);
    }
    const std::string path = (install / "tempPatch" / "patchinfo.xml").string();
    for (const PatchDescription* description : {&all, &removals}) {
        ExpectNoCrash([&] {
            WritePatchDescription(*description, path);
            PatchInfoFile info;
            info.Load(path);
            PatchProgressFile progress;
            progress.SetDirectory(install.string());
            const std::string work = (install / "tempPatch").string();
            PatchStages stages({install.string(), work, PathJoin(work, "patched"), "", "2"}, info, progress, {});
            struct : IArchiveSource {
                ArchiveState WaitForArchive(const std::string&) override { return ArchiveState::Failed; }
            } none;
            if (description == &all) stages.Prepare(none);
            stages.Apply(nullptr);
        });
    }
    // Only the installation and what lies beside it may be in the folder, and nothing beside it may change.
    for (const auto& entry : fs::directory_iterator(root)) {
        if (entry.path() != install && entry.path() != outside && entry.path() != elsewhere) std::abort();
    }
    if (!fs::exists(outside) || !fs::exists(elsewhere / "keep.txt")) std::abort();
    return 0;
}
