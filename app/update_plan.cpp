#include "app/update_plan.h"

#include <sstream>

#include "app/version_text.h"
#include "base/exception.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "base/version_order.h"
#include "net/location.h"
#include "state/configuration.h"
#include "state/installation_data.h"
#include "uninstall/uninstaller.h"

UpdateLayout MakeUpdateLayout(const Configuration& configuration, const std::string& installationFolder) {
    UpdateLayout layout;
    layout.installationFolder = installationFolder;
    layout.patchFolder = PathJoin(installationFolder, configuration.GetPatchInstallPath());
    layout.patchedFilesFolder = PathJoin(layout.patchFolder, configuration.GetPatchedFilesPath());
    layout.patchLocation = configuration.GetPatchUrl();
    layout.buildLocation = configuration.GetCompleteInstallUrl();
    return layout;
}

bool InstallationNeedsUninstall(const std::string& patcherVersion) {
    std::istringstream in(patcherVersion);
    float version = 1.0f;
    if (!(in >> version)) version = 1.0f;
    if (kUpdaterVersion < version) {
        throw Exception("The installed game has used a newer installer than the current, running one.",
                        ErrorCode::NewerInstaller);
    }
    return kUpdaterVersion > version;
}

namespace {

PatchBatch BatchIn(const UpdateLayout& layout, const std::string& location, const std::string& version) {
    return PatchBatch{layout.installationFolder, layout.patchFolder, layout.patchedFilesFolder, location, version};
}

}  // namespace

UpdatePlan PlanUpdate(const UpdateFacts& facts, const UpdateLayout& layout) {
    if (InstallationNeedsUninstall(facts.patcherVersion)) {
        throw Exception("Corrupt installation.", ErrorCode::CorruptData);
    }
    UpdatePlan plan;
    plan.completeBuild =
        BatchIn(layout, JoinLocation(layout.buildLocation, BuildName(facts.latestVersion)), facts.latestVersion);
    switch (facts.interrupted.kind) {
        case InterruptedBatch::Kind::Resume: {
            const PatchBatch& recorded = facts.interrupted.batch;
            if (recorded.patchFolder != layout.patchFolder ||
                recorded.patchedFilesFolder != layout.patchedFilesFolder) {
                LOG(Error) << "The progress record names work folders that are not the program's: "
                           << recorded.patchFolder << ", " << recorded.patchedFilesFolder;
            } else if (!facts.recordedDescriptionFits) {
                LOG(Error) << "The progress record's description cannot be resumed.";
            } else {
                plan.road = Road::Resume;
                plan.batch = BatchIn(layout, recorded.location, recorded.version);
                plan.resumeAt = facts.interrupted.resumeAt;
                return plan;
            }
            plan.road = Road::Reinstall;
            plan.batch = plan.completeBuild;
            return plan;
        }
        case InterruptedBatch::Kind::Reinstall:
            plan.road = Road::Reinstall;
            plan.batch = plan.completeBuild;
            return plan;
        case InterruptedBatch::Kind::None:
            break;
    }
    if (facts.installedVersion.empty()) {
        throw Exception("Could not establish local version.", ErrorCode::NoLocalVersion);
    }
    if (!IsOlderVersion(facts.installedVersion, facts.latestVersion)) return plan;
    plan.road = Road::Patch;
    plan.batch = BatchIn(layout, JoinLocation(layout.patchLocation, PatchName(kPatchBaseVersion, facts.latestVersion)),
                         facts.latestVersion);
    return plan;
}
