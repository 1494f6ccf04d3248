#pragma once

#include <functional>
#include <string>
#include <vector>

class IArchiveSource;
class IStatusView;
class PatchApplier;
class PatchInfoFile;
class PatchProgressFile;

// One patch or complete build as its two stages see it.
struct PatchBatch {
    std::string installationFolder;
    std::string patchFolder;         // the archives arrive here
    std::string patchedFilesFolder;  // stage one builds the new files here
    std::string patchUri;            // where the archives come from, kept for a resume
    std::string version;             // the version the batch leads to
    // Names of the program's own in the installation (relative) that no
    // item may touch, besides the work folders and the progress record.
    std::vector<std::string> protectedNames;
};

// The archive names of a description in the order they are fetched: those
// of "diff" items first, then those of "new" items, each name once (exact
// comparison). Throws when a name could leave the folder it is saved in.
std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info);

// What an interrupted stage two left for the next start to do.
enum class InterruptedBatch {
    None,       // nothing (a leftover record beside a settled version is removed)
    Resume,     // the record is loaded into the progress file: run stage two again
    Reinstall,  // the installation is in change but its record is lost
};
// Decides from the installed version and the records in the progress
// file's folder (set by the caller).
InterruptedBatch FindInterruptedBatch(const std::string& installedVersion, PatchProgressFile& progress);

// The one place that knows the order of the two stages. The updater, the
// publisher's tool and the tests all run a batch through it.
class PatchStages {
public:
    // Stores the installed version ("-1" while stage two works) durably;
    // false when it cannot. May be empty where no version is kept.
    using VersionStore = std::function<bool(const std::string& version)>;

    PatchStages(PatchInfoFile& patchInfo, PatchProgressFile& progressFile, PatchApplier& patchApplier)
        : info(patchInfo), progress(progressFile), applier(patchApplier) {}

    // Stage one: builds every changed and new file in the patched-files
    // folder from the archives that source delivers (it may still be
    // fetching them). The installation is not touched.
    void Prepare(const PatchBatch& batch, IArchiveSource* source, IStatusView* view);

    // Stage two: records the batch (unless a recovered record is being
    // resumed), marks the installation as in change, applies the batch,
    // stores the new version and removes the record. An interruption at
    // any moment is finished by the next start (see FindInterruptedBatch).
    void Apply(const PatchBatch& batch, IStatusView* view, const VersionStore& storeVersion);

private:
    static void Store(const VersionStore& storeVersion, const std::string& version);

    PatchInfoFile& info;
    PatchProgressFile& progress;
    PatchApplier& applier;
    bool prepared = false;
};
