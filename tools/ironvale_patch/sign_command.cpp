// ironvale-patch sign: signs a patch or build folder's description, for a
// folder built without --sign-key or one whose description was edited.
#include <cstdio>
#include <string>
#include <vector>

#include "base/paths.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/signing_key.h"

namespace {

const char kUsage[] = "sign --key PRIVATE.pem PATCH_DIR    write PATCH_DIR/patchinfo.xml.sig";

int Run(const std::vector<std::string>& args) {
    if (args.size() != 3 || args[0] != "--key") return UsageError(kUsage);
    SignPatchDescription(args[2], LoadSigningKey(args[1]));
    std::printf("%s\n", PathJoin(args[2], kDescriptionSignatureName).c_str());
    return 0;
}

const CommandRegistration registration("sign", kUsage, Run);

}  // namespace
