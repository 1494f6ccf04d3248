// ironvale-patch apply PATCH_DIR INSTALL_DIR: both patch stages as the
// updater runs them, with the archives fetched from PATCH_DIR through the
// downloader's file:// copy. For publishers to try a patch on a copy of an
// installation, and for the applier's benchmark.
#include <string>
#include <vector>

#include "tools/ironvale_patch/command.h"
#include "tools/publisher/patch_application.h"

namespace {

const char kUsage[] = "apply PATCH_DIR INSTALL_DIR    apply the patch in PATCH_DIR (patchinfo.xml and archives)";

int Apply(const std::vector<std::string>& args) {
    if (args.size() != 2) return UsageError(kUsage);
    ApplyPatchFolder(args[0], args[1]);
    return 0;
}

const CommandRegistration registration("apply", kUsage, &Apply);

}  // namespace
