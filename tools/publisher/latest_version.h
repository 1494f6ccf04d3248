#pragma once

#include <cstdint>
#include <string>

#include "net/version_statement.h"

struct P256PrivateKey;

// The statement's file: its text and the signature line, signed with key
// (and checked against its public half first).
std::string SignVersionStatement(const VersionStatement& statement, const P256PrivateKey& key);

// Writes site/version.txt.sig, a statement of version signed with key that
// expires lifetimeDays (1 to 366) from now, then site/version.txt. The
// serial is the time now in seconds, or one more than that of the site's
// present statement when that is higher: it grows whichever machine signs
// next, and a site copied back from a backup still gets a new one. Throws
// Exception on every failure.
void PublishLatestVersion(const std::string& site, const std::string& version, int64_t lifetimeDays,
                          const P256PrivateKey& key);
