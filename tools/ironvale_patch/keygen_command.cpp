// ironvale-patch keygen: the publisher's signing key pair. The public half
// is built into the updater (-DIRONVALE_PUBLIC_KEY=public.pem); the private
// half signs every description and stays with the publisher.
#include <cstdio>
#include <string>
#include <vector>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/signing_key.h"

namespace {

const char kUsage[] = "keygen --out DIR    make DIR/private.pem and DIR/public.pem (ECDSA P-256)";

int Run(const std::vector<std::string>& args) {
    if (args.size() != 2 || args[0] != "--out") return UsageError(kUsage);
    if (!MakeDirectories(args[1])) throw Exception("Cannot create " + args[1]);
    WriteKeyPair(args[1], GenerateSigningKey());
    std::printf("%s\n%s\n", PathJoin(args[1], "private.pem").c_str(), PathJoin(args[1], "public.pem").c_str());
    return 0;
}

const CommandRegistration registration("keygen", kUsage, Run);

}  // namespace
