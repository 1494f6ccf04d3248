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

void CheckSignature(const std::string& data, const std::string& signatureDer, const std::string& publicKeyPem,
                    const std::string& name) {
    P256PublicKey key{};
    if (!ParsePublicKeyPem(publicKeyPem, key)) Refuse("The publisher key built into the program cannot be read.");
    P256Signature signature{};
    if (signatureDer.size() > kMaximumSignatureFileSize || !ParseSignatureDer(signatureDer, signature)) {
        Refuse("The signature of " + name + " is not an ECDSA P-256 signature.");
    }
    Sha256 hash;
    hash.Update(data.data(), data.size());
    if (!VerifyP256Signature(key, hash.Finish(), signature)) {
        Refuse("The signature of " + name + " does not match it and the publisher key.");
    }
    LOG(Info) << "Signature verified: " << name;
}

void CheckFileSignature(const std::string& path, const std::string& signaturePath, const std::string& publicKeyPem) {
    std::string data;
    std::string signature;
    if (!ReadFileBytes(path, kMaximumSignedFileSize, data)) Refuse("The signed file " + path + " cannot be read.");
    if (!ReadFileBytes(signaturePath, kMaximumSignatureFileSize, signature)) {
        Refuse("The signature file " + signaturePath + " cannot be read.");
    }
    CheckSignature(data, signature, publicKeyPem, path);
}
