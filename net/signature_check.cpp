#include "net/signature_check.h"

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"

namespace {

[[noreturn]] void Refuse(const std::string& message) {
    LOG(Error) << message;
    throw Exception(message, ErrorCode::CorruptData);
}

}  // namespace

void CheckFileSignature(const std::string& path, const std::string& signaturePath, const std::string& publicKeyPem) {
    P256PublicKey key{};
    if (!ParsePublicKeyPem(publicKeyPem, key)) Refuse("The publisher key built into the program cannot be read.");

    std::string der(kMaximumSignatureFileSize + 1, '\0');
    try {
        FileStream file;
        file.Open(signaturePath);
        der.resize(file.Read(der.data(), static_cast<uint32_t>(der.size())));
    } catch (const Exception&) {
        Refuse("The signature file " + signaturePath + " cannot be read.");
    }
    P256Signature signature{};
    if (der.size() > kMaximumSignatureFileSize || !ParseSignatureDer(der, signature)) {
        Refuse("The signature file " + signaturePath + " does not hold an ECDSA P-256 signature.");
    }

    Sha256Digest digest{};
    int64_t length = 0;
    if (!Sha256OfFile(path, digest, length)) Refuse("The signed file " + path + " cannot be read.");
    if (!VerifyP256Signature(key, digest, signature)) {
        Refuse("The signature in " + signaturePath + " does not match " + path + " and the publisher key.");
    }
    LOG(Info) << "Signature verified: " << path;
}
