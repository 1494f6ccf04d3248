// ironvale-patch version: the latest-version file the updater reads first.
#include <string>
#include <vector>

#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/patch_builder.h"

namespace {

const char kUsage[] = "version --out DIR V";

int Run(const std::vector<std::string>& args) {
    if (args.size() != 3 || args[0] != "--out") return UsageError(kUsage);
    CheckVersionText(args[2]);
    CheckVersionFollows(args[1], args[2]);
    // A version.txt changed alone no longer matches the signed statement
    // beside it, and every updater with a key would refuse it.
    if (FileExists(PathJoin(args[1], "version.txt.sig"))) {
        throw Exception(args[1] + " signs its latest version: use publish-version.");
    }
    if (!MakeDirectories(args[1])) throw Exception("Cannot create " + args[1]);
    const std::string path = PathJoin(args[1], "version.txt");
    if (!ReplaceFileAtomically(path, args[2] + "\n")) throw Exception("Failed to write " + path);
    return 0;
}

const CommandRegistration registration("version", kUsage, Run);

}  // namespace
