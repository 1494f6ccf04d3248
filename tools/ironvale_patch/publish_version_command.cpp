// ironvale-patch publish-version: the latest-version file and the signed,
// expiring statement beside it that updaters with a key require. Run again
// before the statement expires, new version or not.
#include <cstdio>
#include <string>
#include <vector>

#include "base/paths.h"
#include "net/version_statement.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/latest_version.h"
#include "tools/publisher/signing_key.h"

namespace {

const char kUsage[] =
    "publish-version --key PRIVATE.pem --version V --expires-in DAYS SITE    write SITE/version.txt and "
    "SITE/version.txt.sig";

int Run(const std::vector<std::string>& args) {
    // Options in pairs, then the site.
    if (args.size() % 2 == 0) return UsageError(kUsage);
    std::string keyPath, version;
    int64_t days = 0;
    for (size_t i = 0; i + 1 < args.size(); i += 2) {
        if (args[i] == "--key") {
            keyPath = args[i + 1];
        } else if (args[i] == "--version") {
            version = args[i + 1];
        } else if (args[i] != "--expires-in" || !ParseStatementNumber(args[i + 1], days)) {
            return UsageError(kUsage);
        }
    }
    if (keyPath.empty() || version.empty() || days == 0) return UsageError(kUsage);
    PublishLatestVersion(args.back(), version, days, LoadSigningKey(keyPath));
    std::printf("%s\n", PathJoin(args.back(), "version.txt.sig").c_str());
    return 0;
}

const CommandRegistration registration("publish-version", kUsage, Run);

}  // namespace
