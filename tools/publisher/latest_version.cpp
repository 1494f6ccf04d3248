#include "tools/publisher/latest_version.h"

#include <algorithm>
#include <ctime>

#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "net/sha256.h"
#include "net/signature_check.h"
#include "net/signature_formats.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/signing_key.h"

std::string SignVersionStatement(const VersionStatement& statement, const P256PrivateKey& key) {
    const std::string text = StatementText(statement);
    Sha256 hash;
    hash.Update(text.data(), text.size());
    const Sha256Digest digest = hash.Finish();
    const P256Signature signature = SignDigest(key, digest);
    if (!VerifyP256Signature(key.publicKey, digest, signature)) {
        throw Exception("The signing key's public point does not belong to its private scalar.");
    }
    return text + "signature " + EncodeBase64(SignatureDer(signature)) + "\n";
}

void PublishLatestVersion(const std::string& site, const std::string& version, int64_t lifetimeDays,
                          const P256PrivateKey& key) {
    CheckVersionText(version);
    CheckVersionFollows(site, version);
    // An updater that cannot confirm the latest version tells its player so;
    // a statement that lives longer lets an attacker hide an update longer.
    if (lifetimeDays < 1 || lifetimeDays > 366) throw Exception("A statement expires in 1 to 366 days.");
    if (!MakeDirectories(site)) throw Exception("Cannot create " + site);
    VersionStatement statement;
    statement.version = version;
    const int64_t now = static_cast<int64_t>(std::time(nullptr));
    statement.serial = now;
    statement.expires = now + lifetimeDays * 24 * 60 * 60;
    const std::string statementPath = PathJoin(site, "version.txt.sig");
    std::string present;
    VersionStatement previous;
    std::string signedText;
    std::string signature;
    if (ReadFileBytes(statementPath, kMaximumStatementFileSize, present) &&
        ParseVersionStatement(present, previous, signedText, signature)) {
        statement.serial = std::max(statement.serial, previous.serial + 1);
    }
    // Updaters refuse a serial more than a day ahead of their clock.
    if (statement.serial > now + 24 * 60 * 60) {
        throw Exception(statementPath + " has serial " + std::to_string(previous.serial) +
                        ", more than a day ahead of this machine's clock: check the clock, or remove the statement.");
    }
    // The statement first: a keyed updater that reads the two files between
    // the writes cannot confirm the version and asks its player to try later.
    if (!ReplaceFileAtomically(statementPath, SignVersionStatement(statement, key))) {
        throw Exception("Failed to write " + statementPath);
    }
    const std::string versionPath = PathJoin(site, "version.txt");
    if (!ReplaceFileAtomically(versionPath, version + "\n")) throw Exception("Failed to write " + versionPath);
}
