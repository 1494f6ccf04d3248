#include <fcntl.h>
#include <openssl/bn.h>
#include <openssl/core_names.h>
#include <openssl/ecdsa.h>
#include <openssl/evp.h>
#include <openssl/x509.h>
#include <unistd.h>

#include "base/exception.h"
#include "base/unique_handle_posix.h"
#include "net/openssl_handles_posix.h"
#include "tools/publisher/signing_key.h"

namespace {

// Cleared as it is freed: it is the private key.
struct SecretNumberTraits {
    using Value = BIGNUM*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { BN_clear_free(value); }
};

}  // namespace

P256PrivateKey GenerateSigningKey() {
    const EvpKey pair(EVP_PKEY_Q_keygen(nullptr, nullptr, "EC", "P-256"));
    UniqueHandle<SecretNumberTraits> scalar;
    const bool gotScalar = pair && EVP_PKEY_get_bn_param(pair.Get(), OSSL_PKEY_PARAM_PRIV_KEY, scalar.Receive()) == 1;
    P256PrivateKey key;
    size_t pointSize = 0;
    if (!gotScalar || BN_bn2binpad(scalar.Get(), key.scalar.data(), static_cast<int>(key.scalar.size())) < 0 ||
        EVP_PKEY_get_octet_string_param(pair.Get(), OSSL_PKEY_PARAM_PUB_KEY, key.publicKey.data(), key.publicKey.size(),
                                        &pointSize) != 1 ||
        pointSize != key.publicKey.size() || key.publicKey[0] != 0x04) {
        throw Exception("Cannot make an ECDSA P-256 key.");
    }
    return key;
}

P256Signature SignDigest(const P256PrivateKey& key, const Sha256Digest& digest) {
    const std::string keyDer = PrivateKeyDer(key);
    const unsigned char* keyBytes = reinterpret_cast<const unsigned char*>(keyDer.data());
    const EvpKey pair(d2i_AutoPrivateKey(nullptr, &keyBytes, static_cast<long>(keyDer.size())));
    const EvpKeyContext context(pair ? EVP_PKEY_CTX_new(pair.Get(), nullptr) : nullptr);
    unsigned char der[80];
    size_t size = sizeof der;
    P256Signature signature{};
    if (!context || EVP_PKEY_sign_init(context.Get()) != 1 ||
        EVP_PKEY_sign(context.Get(), der, &size, digest.data(), digest.size()) != 1 ||
        !ParseSignatureDer(std::string(reinterpret_cast<const char*>(der), size), signature)) {
        throw Exception("Cannot sign with the ECDSA P-256 key.");
    }
    return signature;
}

bool WritePrivateFile(const std::string& path, const std::string& text) {
    bool ok = false;
    {
        const UniqueFileDescriptor file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
        if (!file) return false;
        size_t done = 0;
        while (done < text.size()) {
            const ssize_t count = write(file.Get(), text.data() + done, text.size() - done);
            if (count <= 0) break;
            done += static_cast<size_t>(count);
        }
        ok = done == text.size() && fsync(file.Get()) == 0;
    }
    if (!ok) unlink(path.c_str());
    return ok;
}
