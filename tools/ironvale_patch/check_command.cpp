// ironvale-patch check: what the updater checks before it uses a patch
// folder, for a copy on a mirror or one just fetched: every archive against
// the size and SHA-256 its description declares and, given the public key,
// the description's signature.
#include <cstdio>
#include <string>
#include <vector>

#include "base/exception.h"
#include "base/paths.h"
#include "net/sha256.h"
#include "net/signature_check.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/signing_key.h"

namespace {

const char kUsage[] = "check PATCH_DIR [--public-key PUBLIC.pem]";

int Run(const std::vector<std::string>& args) {
    if (args.size() != 1 && (args.size() != 3 || args[1] != "--public-key")) return UsageError(kUsage);
    const std::string description = PathJoin(args[0], "patchinfo.xml");
    if (args.size() == 3) {
        CheckFileSignature(description, PathJoin(args[0], kDescriptionSignatureName), ReadPemFile(args[2]));
        std::printf("signature: ok\n");
    }
    PatchInfoFile info;
    info.Load(description);
    int wrong = 0;
    for (const std::string& name : ArchivesInFetchOrder(info)) {
        const auto declared = info.GetDeclaredArchives().find(name);
        Sha256Digest digest{};
        int64_t length = 0;
        if (declared == info.GetDeclaredArchives().end()) {
            std::printf("%s: not declared\n", name.c_str());
        } else if (!Sha256OfFile(PathJoin(args[0], name), digest, length)) {
            std::printf("%s: cannot be read\n", name.c_str());
        } else if (length != declared->second.size ||
                   HexDigits(digest.data(), digest.size()) != declared->second.sha256) {
            std::printf("%s: %s bytes, SHA-256 %s, not as declared\n", name.c_str(), std::to_string(length).c_str(),
                        HexDigits(digest.data(), digest.size()).c_str());
        } else {
            std::printf("%s: ok\n", name.c_str());
            continue;
        }
        ++wrong;
    }
    return wrong == 0 ? 0 : 1;
}

const CommandRegistration registration("check", kUsage, Run);

}  // namespace
