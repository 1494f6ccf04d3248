#include <fcntl.h>
#include <openssl/bn.h>
#include <openssl/core_names.h>
#include <openssl/ecdsa.h>
#include <openssl/evp.h>
#include <openssl/x509.h>
#include <unistd.h>

#include <memory>

#include "base/exception.h"
#include "tools/publisher/signing_key.h"

namespace {

struct KeyFree {
    void operator()(EVP_PKEY* key) const { EVP_PKEY_free(key); }
};
struct ContextFree {
    void operator()(EVP_PKEY_CTX* context) const { EVP_PKEY_CTX_free(context); }
};
struct NumberFree {
    void operator()(BIGNUM* number) const { BN_clear_free(number); }
};
class Descriptor {
public:
    explicit Descriptor(int opened) : value(opened) {}
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    ~Descriptor() {
        if (value >= 0) close(value);
    }
    const int value;
};

}  // namespace

P256PrivateKey GenerateSigningKey() {
    const std::unique_ptr<EVP_PKEY, KeyFree> pair(EVP_PKEY_Q_keygen(nullptr, nullptr, "EC", "P-256"));
    BIGNUM* scalar = nullptr;
    const bool gotScalar = pair && EVP_PKEY_get_bn_param(pair.get(), OSSL_PKEY_PARAM_PRIV_KEY, &scalar) == 1;
    const std::unique_ptr<BIGNUM, NumberFree> scalarHolder(scalar);
    P256PrivateKey key;
    size_t pointSize = 0;
    if (!gotScalar || BN_bn2binpad(scalar, key.scalar.data(), static_cast<int>(key.scalar.size())) < 0 ||
        EVP_PKEY_get_octet_string_param(pair.get(), OSSL_PKEY_PARAM_PUB_KEY, key.publicKey.data(), key.publicKey.size(),
                                        &pointSize) != 1 ||
        pointSize != key.publicKey.size() || key.publicKey[0] != 0x04) {
        throw Exception("Cannot make an ECDSA P-256 key.");
    }
    return key;
}

P256Signature SignDigest(const P256PrivateKey& key, const Sha256Digest& digest) {
    const std::string keyDer = PrivateKeyDer(key);
    const unsigned char* keyBytes = reinterpret_cast<const unsigned char*>(keyDer.data());
    const std::unique_ptr<EVP_PKEY, KeyFree> pair(
        d2i_AutoPrivateKey(nullptr, &keyBytes, static_cast<long>(keyDer.size())));
    const std::unique_ptr<EVP_PKEY_CTX, ContextFree> context(pair ? EVP_PKEY_CTX_new(pair.get(), nullptr) : nullptr);
    unsigned char der[80];
    size_t size = sizeof der;
    P256Signature signature{};
    if (!context || EVP_PKEY_sign_init(context.get()) != 1 ||
        EVP_PKEY_sign(context.get(), der, &size, digest.data(), digest.size()) != 1 ||
        !ParseSignatureDer(std::string(reinterpret_cast<const char*>(der), size), signature)) {
        throw Exception("Cannot sign with the ECDSA P-256 key.");
    }
    return signature;
}

bool WritePrivateFile(const std::string& path, const std::string& text) {
    bool ok = false;
    {
        const Descriptor file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
        if (file.value < 0) return false;
        size_t done = 0;
        while (done < text.size()) {
            const ssize_t count = write(file.value, text.data() + done, text.size() - done);
            if (count <= 0) break;
            done += static_cast<size_t>(count);
        }
        ok = done == text.size() && fsync(file.value) == 0;
    }
    if (!ok) unlink(path.c_str());
    return ok;
}
