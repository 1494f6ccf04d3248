// ironvale-patch apply PATCH_DIR INSTALL_DIR: both patch stages as the
// updater runs them, with the archives fetched from PATCH_DIR through the
// downloader's file:// copy. For publishers to try a patch on a copy of an
// installation, and for the applier's benchmark.
#include <string>
#include <vector>

#include "patch/patch_applier.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/patch_application.h"

namespace {

const char kUsage[] =
    "apply [--workers N] PATCH_DIR INSTALL_DIR    apply the patch in PATCH_DIR (patchinfo.xml and archives), "
    "stage one on N workers (default: the cores)";

int Apply(const std::vector<std::string>& args) {
    size_t workers = DefaultStageOneWorkers();
    std::vector<std::string> folders = args;
    if (folders.size() == 4 && folders[0] == "--workers") {
        const std::string& count = folders[1];
        if (count.empty() || count.size() > 3 || count.find_first_not_of("0123456789") != std::string::npos ||
            std::stoi(count) == 0) {
            return UsageError(kUsage);
        }
        workers = std::stoul(count);
        folders.erase(folders.begin(), folders.begin() + 2);
    }
    if (folders.size() != 2) return UsageError(kUsage);
    ApplyPatchFolder(folders[0], folders[1], workers);
    return 0;
}

const CommandRegistration registration("apply", kUsage, &Apply);

}  // namespace
