// ironvale-patch build: a patch from one game tree to the next, or the
// complete build of a tree, in the folder the updater asks for.
#include <cstdio>
#include <iostream>
#include <string>
#include <vector>

#include "base/exception.h"
#include "patch/patch_info_file.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/signing_key.h"

namespace {

const char kUsage[] =
    "build (--from OLD_DIR [--from-version V0] | --complete) --to NEW_DIR --version V --out DIR "
    "[--max-archive-size BYTES] [--registry-path KEY] [--registry-hive HIVE] [--xdelta3 PROGRAM] "
    "[--sign-key PRIVATE.pem]    a signed patch needs --from-version";

bool ParseSize(const std::string& text, int64_t& value) {
    if (text.empty() || text.size() > 18 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    value = std::stoll(text);
    return value > 0;
}

int Run(const std::vector<std::string>& args) {
    BuildOptions options;
    options.progress = &std::cerr;
    bool complete = false;
    P256PrivateKey signingKey;
    for (size_t i = 0; i < args.size(); ++i) {
        const std::string& option = args[i];
        if (option == "--complete") {
            complete = true;
            continue;
        }
        if (i + 1 >= args.size()) return UsageError(kUsage);
        const std::string& value = args[++i];
        if (option == "--from") {
            options.fromDir = value;
        } else if (option == "--from-version") {
            options.fromVersion = value;
        } else if (option == "--to") {
            options.toDir = value;
        } else if (option == "--version") {
            options.version = value;
        } else if (option == "--out") {
            options.outDir = value;
        } else if (option == "--max-archive-size") {
            if (!ParseSize(value, options.maxArchiveSize)) return UsageError(kUsage);
        } else if (option == "--registry-path") {
            options.registryPath = value;
        } else if (option == "--registry-hive") {
            options.hive = PatchInfoFile::ParseHive(value);
        } else if (option == "--xdelta3") {
            options.xdelta3 = value;
        } else if (option == "--sign-key") {
            // Read before the build, which may take long, can fail on it.
            signingKey = LoadSigningKey(value);
            options.signingKey = &signingKey;
        } else {
            return UsageError(kUsage);
        }
    }
    if (complete == !options.fromDir.empty() || options.toDir.empty() || options.version.empty() ||
        options.outDir.empty()) {
        return UsageError(kUsage);
    }
    const std::string folder = BuildPatch(options);
    std::printf("%s\n", folder.c_str());
    return 0;
}

const CommandRegistration registration("build", kUsage, Run);

}  // namespace
