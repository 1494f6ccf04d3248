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
};

// The archive names of a description in the order they are fetched: those
// of "diff" items first, then those of "new" items, each name once (exact
// comparison). Throws when a name could leave the folder it is saved in.
std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info);

// The one place that knows the order of the two stages. The updater, the
// publisher's tool and the tests all run a batch through it.
class PatchStages {
public:
    // Stores the new installed version ("-1" while stage two works); may be
    // empty where no version is kept.
    using VersionStore = std::function<void(const std::string& version)>;

    PatchStages(PatchInfoFile& patchInfo, PatchProgressFile& progressFile, PatchApplier& patchApplier)
        : info(patchInfo), progress(progressFile), applier(patchApplier) {}

    // Stage one: builds every changed and new file in the patched-files
    // folder from the archives that source delivers (it may still be
    // fetching them). The installation is not touched.
    void Prepare(const PatchBatch& batch, IArchiveSource* source, IStatusView* view);

    // Stage two: marks the installation as in change, records the batch
    // (unless a recovered record is being resumed), applies it, stores the
    // new version and removes the record. An interruption at any moment is
    // finished by the next run from the record.
    void Apply(const PatchBatch& batch, IStatusView* view, const VersionStore& storeVersion);

private:
    PatchInfoFile& info;
    PatchProgressFile& progress;
    PatchApplier& applier;
    bool prepared = false;
};
