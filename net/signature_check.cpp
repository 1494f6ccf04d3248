#include "net/signature_check.h"

#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"

namespace {

[[noreturn]] void Refuse(const std::string& message) {
    LOG(Error) << message;
    throw Exception(message, ErrorCode::CorruptData);
}

}  // namespace

void CheckSignature(const std::string& data, const std::string& signatureDer, const std::string& publicKeysPem,
                    const std::string& name) {
    std::vector<P256PublicKey> keys;
    if (!ParsePublicKeysPem(publicKeysPem, keys)) Refuse("The publisher key built into the program cannot be read.");
    P256Signature signature{};
    if (signatureDer.size() > kMaximumSignatureFileSize || !ParseSignatureDer(signatureDer, signature)) {
        Refuse("The signature of " + name + " is not an ECDSA P-256 signature.");
    }
    Sha256 hash;
    hash.Update(data.data(), data.size());
    const Sha256Digest digest = hash.Finish();
    for (size_t index = 0; index < keys.size(); ++index) {
        if (VerifyP256Signature(keys[index], digest, signature)) {
            // Which key signed tells the publisher when an old one may go.
            LOG(Info) << "Signature verified (publisher key " << index + 1 << " of " << keys.size() << "): " << name;
            return;
        }
    }
    Refuse("The signature of " + name + " does not match it and any publisher key.");
}

void CheckFileSignature(const std::string& path, const std::string& signaturePath, const std::string& publicKeysPem) {
    std::string data;
    std::string signature;
    if (!ReadFileBytes(path, kMaximumSignedFileSize, data)) Refuse("The signed file " + path + " cannot be read.");
    if (!ReadFileBytes(signaturePath, kMaximumSignatureFileSize, signature)) {
        Refuse("The signature file " + signaturePath + " cannot be read.");
    }
    CheckSignature(data, signature, publicKeysPem, path);
}
