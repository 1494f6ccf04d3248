#include "tools/publisher/signing_key.h"

#include <cstring>

#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "net/signature_check.h"

const char kDescriptionSignatureName[] = "patchinfo.xml.sig";

namespace {

// PKCS#8 PrivateKeyInfo of a P-256 key around its ECPrivateKey (version 1,
// the scalar, the public point), as OpenSSL writes it: the bytes before the
// scalar and those between scalar and point.
const uint8_t kPkcs8Head[] = {0x30, 0x81, 0x87, 0x02, 0x01, 0x00, 0x30, 0x13, 0x06, 0x07, 0x2a, 0x86,
                              0x48, 0xce, 0x3d, 0x02, 0x01, 0x06, 0x08, 0x2a, 0x86, 0x48, 0xce, 0x3d,
                              0x03, 0x01, 0x07, 0x04, 0x6d, 0x30, 0x6b, 0x02, 0x01, 0x01, 0x04, 0x20};
const uint8_t kPkcs8Middle[] = {0xa1, 0x44, 0x03, 0x42, 0x00};
// SEC1 ECPrivateKey with the curve named in its parameters.
const uint8_t kSec1Head[] = {0x30, 0x77, 0x02, 0x01, 0x01, 0x04, 0x20};
const uint8_t kSec1Middle[] = {0xa0, 0x0a, 0x06, 0x08, 0x2a, 0x86, 0x48, 0xce, 0x3d,
                               0x03, 0x01, 0x07, 0xa1, 0x44, 0x03, 0x42, 0x00};

template <size_t HeadSize, size_t MiddleSize>
bool ReadFramedKey(const std::string& der, const uint8_t (&head)[HeadSize], const uint8_t (&middle)[MiddleSize],
                   P256PrivateKey& key) {
    const size_t scalarAt = HeadSize;
    const size_t pointAt = scalarAt + key.scalar.size() + MiddleSize;
    if (der.size() != pointAt + key.publicKey.size()) return false;
    if (std::memcmp(der.data(), head, HeadSize) != 0) return false;
    if (std::memcmp(der.data() + scalarAt + key.scalar.size(), middle, MiddleSize) != 0) return false;
    if (static_cast<uint8_t>(der[pointAt]) != 0x04) return false;
    std::memcpy(key.scalar.data(), der.data() + scalarAt, key.scalar.size());
    std::memcpy(key.publicKey.data(), der.data() + pointAt, key.publicKey.size());
    return true;
}

std::string Bytes(const void* data, size_t size) { return std::string(static_cast<const char*>(data), size); }

}  // namespace

std::string PrivateKeyDer(const P256PrivateKey& key) {
    return Bytes(kPkcs8Head, sizeof kPkcs8Head) + Bytes(key.scalar.data(), key.scalar.size()) +
           Bytes(kPkcs8Middle, sizeof kPkcs8Middle) + Bytes(key.publicKey.data(), key.publicKey.size());
}

std::string PrivateKeyPem(const P256PrivateKey& key) { return EncodePem("PRIVATE KEY", PrivateKeyDer(key)); }

P256PrivateKey ParsePrivateKeyPem(const std::string& text) {
    P256PrivateKey key;
    std::string der;
    if (DecodePem(text, "PRIVATE KEY", der) && ReadFramedKey(der, kPkcs8Head, kPkcs8Middle, key)) return key;
    if (DecodePem(text, "EC PRIVATE KEY", der) && ReadFramedKey(der, kSec1Head, kSec1Middle, key)) return key;
    throw Exception("Not an ECDSA P-256 private key in PEM with its public point (PKCS#8 or SEC1).");
}

P256PrivateKey LoadSigningKey(const std::string& path) {
    try {
        return ParsePrivateKeyPem(ReadPemFile(path));
    } catch (const Exception& error) {
        throw Exception(path + ": " + error.message);
    }
}

std::string ReadPemFile(const std::string& path) {
    FileStream file;
    file.Open(path);
    // One byte more than a key may have, so a longer file fails to parse.
    std::string text(kMaximumPemSize + 1, '\0');
    text.resize(file.Read(text.data(), static_cast<uint32_t>(text.size())));
    return text;
}

void WriteKeyPair(const std::string& folder, const P256PrivateKey& key) {
    const std::string privatePath = PathJoin(folder, "private.pem");
    const std::string publicPath = PathJoin(folder, "public.pem");
    if (!WritePrivateFile(privatePath, PrivateKeyPem(key))) {
        throw Exception("Cannot create " + privatePath + " (an existing key is never replaced)");
    }
    if (!ReplaceFileAtomically(publicPath, PublicKeyPem(key.publicKey))) throw Exception("Cannot write " + publicPath);
}

void SignPatchDescription(const std::string& folder, const P256PrivateKey& key) {
    const std::string description = PathJoin(folder, "patchinfo.xml");
    Sha256Digest digest{};
    int64_t length = 0;
    if (!Sha256OfFile(description, digest, length)) throw Exception("Cannot read " + description);
    const P256Signature signature = SignDigest(key, digest);
    // A key file whose two halves do not belong together would sign what
    // no updater accepts.
    if (!VerifyP256Signature(key.publicKey, digest, signature)) {
        throw Exception("The signing key's public point does not belong to its private scalar.");
    }
    const std::string path = PathJoin(folder, kDescriptionSignatureName);
    if (!ReplaceFileAtomically(path, SignatureDer(signature))) throw Exception("Cannot write " + path);
}
