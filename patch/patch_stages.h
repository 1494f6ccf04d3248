#pragma once

#include <optional>
#include <string>
#include <vector>

#include "patch/patch_applier.h"
#include "patch/patch_batch.h"

class IArchiveSource;
class PatchInfoFile;
class PatchProgressFile;

// The archive names of a description in the order they are fetched: those
// of "diff" items first, then those of "new" items, each name once (exact
// comparison). Throws when a name could leave the folder it is saved in.
std::vector<std::string> ArchivesInFetchOrder(PatchInfoFile& info);

// What an interrupted stage two left for the next start to do.
struct InterruptedBatch {
    enum class Kind {
        None,       // nothing (a leftover record beside a settled version is removed)
        Resume,     // run stage two again from the record
        Reinstall,  // the installation is in change but its record is lost
    };
    Kind kind = Kind::None;
    // Resume: the batch as its record names it (folders, location, version;
    // the installation folder and protected names are the caller's).
    PatchBatch batch;
    ResumePoint resumeAt;
};
// Reads the records in the progress file's folder (set by the caller)
// beside the installed version.
InterruptedBatch FindInterruptedBatch(const std::string& installedVersion, PatchProgressFile& progress);

// What stage two keeps besides its progress record.
class IInstallationRecords {
public:
    // Stores the installed version ("-1" while stage two works) durably;
    // throws Exception when it cannot.
    virtual void StoreVersion(const std::string& version) = 0;
    // The batch's changes are in place: what it added is recorded, durably,
    // before its new version is stored. It may run again for the same
    // batch after an interruption. A failure here does not undo the batch.
    virtual void RecordInstalledBatch(const PatchBatch& batch, PatchInfoFile& description) = 0;

protected:
    IInstallationRecords() = default;
    IInstallationRecords(const IInstallationRecords&) = default;
    IInstallationRecords& operator=(const IInstallationRecords&) = default;
    ~IInstallationRecords() = default;
};

// The one place that knows the order of the two stages and of the records
// they write. The updater, the publisher's tool and the tests all run a
// batch through it.
class PatchStages {
public:
    // The description and the progress record are borrowed.
    PatchStages(const PatchBatch& batch, PatchInfoFile& description, PatchProgressFile& progress,
                const StageServices& services)
        : work(batch), info(description), progressFile(progress), applier(batch, description, progress, services) {}

    // Stage one: builds every changed and new file in the patched-files
    // folder from the archives that archives delivers (it may still be
    // fetching them). The installation is not touched.
    void Prepare(IArchiveSource& archives);

    // Stage two, writing the installation's records in this order:
    //   1. the progress record of the batch (unless resumeAt continues a
    //      recovered one),
    //   2. the installed version "-1" (records may be null where no
    //      version is kept),
    //   3. each deletion and folder action behind its own progress record,
    //      then the moves,
    //   4. what the batch installed (the uninstall record, the history),
    //   5. the new version,
    //   6. the progress record removed.
    // An interruption at any moment is finished by the next start (see
    // FindInterruptedBatch).
    void Apply(IInstallationRecords* records, const std::optional<ResumePoint>& resumeAt = std::nullopt);

private:
    const PatchBatch work;
    PatchInfoFile& info;
    PatchProgressFile& progressFile;
    PatchApplier applier;
};
