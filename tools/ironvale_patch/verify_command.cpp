// ironvale-patch verify: applies a patch with the updater's own applier to
// a copy of the old tree and checks that the new tree comes out.
#include <cstdio>
#include <string>
#include <vector>

#include "tools/ironvale_patch/command.h"
#include "tools/publisher/patch_verifier.h"

namespace {

const char kUsage[] = "verify PATCH_DIR OLD_DIR NEW_DIR";

int Run(const std::vector<std::string>& args) {
    if (args.size() != 3) return UsageError(kUsage);
    const std::vector<std::string> differences = VerifyPatch(args[0], args[1], args[2]);
    for (const std::string& line : differences) std::printf("%s\n", line.c_str());
    if (!differences.empty()) {
        std::printf("FAILED: %s difference(s) between the patched copy of %s and %s\n",
                    std::to_string(differences.size()).c_str(), args[1].c_str(), args[2].c_str());
        return 1;
    }
    std::printf("OK: %s turns %s into %s\n", args[0].c_str(), args[1].c_str(), args[2].c_str());
    return 0;
}

const CommandRegistration registration("verify", kUsage, Run);

}  // namespace
