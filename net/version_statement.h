#pragma once

#include <cstdint>
#include <string>

// The publisher's signed word on the latest version, served as
// "version.txt.sig" beside "version.txt": which version is the latest, a
// serial number that grows with every statement, and the moment the
// statement stops counting. A network attacker can serve an old
// "version.txt" forever or a bogus high one; an old statement runs out and
// a bogus one carries no signature.
struct VersionStatement {
    std::string version;
    int64_t serial = 0;
    int64_t expires = 0;  // seconds since 1970-01-01 UTC
};

// A statement is four short lines and a signature; anything much larger is
// refused unread.
constexpr int64_t kMaximumStatementFileSize = 1024;

// The bytes the signature covers, each line ended by LF:
//   ironvale-latest-version 1
//   version V
//   serial N
//   expires T
// The first line keeps a statement from ever reading as a patch
// description (or one as the other) under the same key.
std::string StatementText(const VersionStatement& statement);

// A serial or a time: 1 to 18 decimal digits, no sign, no leading zero.
bool ParseStatementNumber(const std::string& text, int64_t& value);

// The file: the statement's text, then "signature " and the DER signature
// in Base64, and LF. Parsing is strict (each value has one spelling, so the
// signed text is exactly StatementText of what was read); false for
// anything else. signedText gets the bytes the signature covers.
bool ParseVersionStatement(const std::string& file, VersionStatement& statement, std::string& signedText,
                           std::string& signatureDer);

// Throws Exception with VersionUnconfirmed (and logs why) unless file is a
// statement signed by one of the keys in publicKeysPem that names latest,
// has not expired at serverNow (seconds since 1970 by the server's clock)
// and whose serial is at least lowestSerial and at most a day after
// serverNow (the publisher's tool takes the time of signing). Returns the
// statement.
VersionStatement CheckVersionStatement(const std::string& file, const std::string& publicKeysPem,
                                       const std::string& latest, int64_t serverNow, int64_t lowestSerial);
