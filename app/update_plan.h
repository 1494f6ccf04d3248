#pragma once

#include <string>

#include "patch/patch_batch.h"
#include "patch/patch_stages.h"

class Configuration;

// Where the program keeps a batch's work, and where it finds the patches
// and builds it installs.
struct UpdateLayout {
    std::string installationFolder;
    std::string patchFolder;         // the installation's work folder ("tempPatch")
    std::string patchedFilesFolder;  // inside it ("patched")
    std::string patchLocation;       // where patches are served
    std::string buildLocation;       // where complete builds are served
};
UpdateLayout MakeUpdateLayout(const Configuration& configuration, const std::string& installationFolder);

// A patch description as the program checked it: its text, and the
// signature that vouches for it (empty in a program without a key). Only
// these bytes are ever parsed.
struct CheckedDescription {
    std::string text;
    std::string signature;
};

// What the run found before it decides.
struct UpdateFacts {
    std::string installedVersion;  // the installation data's ("-1": stage two was interrupted)
    std::string patcherVersion;    // of the updater that recorded the installation
    std::string latestVersion;     // the server's, or the command line's
    InterruptedBatch interrupted;  // what an interrupted stage two left
    // Resume: the description in the program's work folder, and whether it
    // passed the checks a fetched one passes (its signature, when the
    // program has a key) and leads to the version the record names.
    CheckedDescription recordedDescription;
    bool recordedDescriptionFits = false;
};

enum class Road {
    UpToDate,   // nothing to do
    Resume,     // finish an interrupted stage two, then decide again
    Patch,      // the patch from the installed version to the latest
    Reinstall,  // the complete build of the latest version
};

struct UpdatePlan {
    Road road = Road::UpToDate;
    PatchBatch batch;          // what the road installs
    ResumePoint resumeAt;      // Resume: where stage two starts again
    PatchBatch completeBuild;  // Patch: offered when the patch does not fit the installation
};

// Whether an installation recorded by the updater of patcherVersion (a
// number as text; anything else counts as 1.0) must be uninstalled before
// this one may serve it. Throws NewerInstaller when a newer updater made it.
bool InstallationNeedsUninstall(const std::string& patcherVersion);

// The one decision of a run, from what it found: which road it takes and
// the batch that road installs. A progress record is data, never
// instructions: one that names work folders other than the program's own,
// or whose description does not fit it, is not resumed; the complete
// build finishes the installation instead. Throws CorruptData for an
// installation of an older updater, NewerInstaller for one of a newer
// updater, and NoLocalVersion for an installation without a version that
// needs a patch.
UpdatePlan PlanUpdate(const UpdateFacts& facts, const UpdateLayout& layout);
