#include "net/version_statement.h"

#include "base/exception.h"
#include "base/log.h"
#include "net/signature_check.h"
#include "net/signature_formats.h"

namespace {

const char kHeader[] = "ironvale-latest-version 1";

// The longest version the publisher's tool writes.
constexpr size_t kMaximumVersionSize = 64;

// Serials are the time of signing. One from further ahead would block
// every real statement until then once remembered: with a stolen key, the
// fast-forward lasts a day at most.
constexpr int64_t kSerialLeeway = 24 * 60 * 60;

// The line at at that begins with prefix: what follows the prefix up to the
// LF, and at moves past the LF.
bool ReadLine(const std::string& text, size_t& at, const std::string& prefix, std::string& value) {
    const size_t end = text.find('\n', at);
    if (end == std::string::npos || end - at < prefix.size() || text.compare(at, prefix.size(), prefix) != 0) {
        return false;
    }
    value = text.substr(at + prefix.size(), end - at - prefix.size());
    at = end + 1;
    return true;
}

// A word as the first word of "version.txt" can hold it: no blanks, line
// breaks or other control characters.
bool IsVersionWord(const std::string& text) {
    if (text.empty() || text.size() > kMaximumVersionSize) return false;
    for (const char c : text) {
        if (static_cast<unsigned char>(c) <= 0x20 || c == 0x7F) return false;
    }
    return true;
}

[[noreturn]] void Unconfirmed(const std::string& message) {
    LOG(Error) << message;
    throw Exception(message, ErrorCode::VersionUnconfirmed);
}

}  // namespace

std::string StatementText(const VersionStatement& statement) {
    return std::string(kHeader) + "\nversion " + statement.version + "\nserial " + std::to_string(statement.serial) +
           "\nexpires " + std::to_string(statement.expires) + "\n";
}

bool ParseStatementNumber(const std::string& text, int64_t& value) {
    if (text.empty() || text.size() > 18 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    if (text.size() > 1 && text[0] == '0') return false;
    value = std::stoll(text);
    return true;
}

bool ParseVersionStatement(const std::string& file, VersionStatement& statement, std::string& signedText,
                           std::string& signatureDer) {
    if (file.size() > static_cast<size_t>(kMaximumStatementFileSize)) return false;
    size_t at = 0;
    std::string header, serial, expires, signature;
    if (!ReadLine(file, at, "", header) || header != kHeader || !ReadLine(file, at, "version ", statement.version) ||
        !ReadLine(file, at, "serial ", serial) || !ReadLine(file, at, "expires ", expires)) {
        return false;
    }
    signedText = file.substr(0, at);
    return ReadLine(file, at, "signature ", signature) && at == file.size() && IsVersionWord(statement.version) &&
           ParseStatementNumber(serial, statement.serial) && ParseStatementNumber(expires, statement.expires) &&
           signature.find_first_of(" \t\r") == std::string::npos && DecodeBase64(signature, signatureDer);
}

VersionStatement CheckVersionStatement(const std::string& file, const std::string& publicKeysPem,
                                       const std::string& latest, int64_t serverNow, int64_t lowestSerial) {
    VersionStatement statement;
    std::string signedText;
    std::string signature;
    if (!ParseVersionStatement(file, statement, signedText, signature)) {
        Unconfirmed("The statement of the latest version is not well formed.");
    }
    try {
        CheckSignature(signedText, signature, publicKeysPem, "the statement of the latest version");
    } catch (const Exception& error) {
        throw Exception(error.message, ErrorCode::VersionUnconfirmed);
    }
    if (statement.version != latest) {
        Unconfirmed("The signed latest version is " + statement.version + ", but version.txt names " + latest + ".");
    }
    // An old statement replayed would keep players from the version that
    // fixes a hole; its end bounds how long.
    if (statement.expires <= serverNow) {
        Unconfirmed("The statement of the latest version expired at " + std::to_string(statement.expires) +
                    "; the server's clock says " + std::to_string(serverNow) + ".");
    }
    if (statement.serial < lowestSerial) {
        Unconfirmed("The statement of the latest version has serial " + std::to_string(statement.serial) +
                    ", older than the " + std::to_string(lowestSerial) + " accepted before.");
    }
    if (statement.serial > serverNow + kSerialLeeway) {
        Unconfirmed("The statement of the latest version has serial " + std::to_string(statement.serial) +
                    ", from after the server's clock (" + std::to_string(serverNow) + ").");
    }
    LOG(Info) << "Latest version " << latest << " confirmed (serial " << statement.serial << ", expires "
              << statement.expires << ").";
    return statement;
}
