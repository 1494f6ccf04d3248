#include <openssl/ecdsa.h>
#include <openssl/evp.h>
#include <openssl/x509.h>

#include <memory>

#include "net/signature_check.h"

namespace {

struct KeyFree {
    void operator()(EVP_PKEY* key) const { EVP_PKEY_free(key); }
};
struct ContextFree {
    void operator()(EVP_PKEY_CTX* context) const { EVP_PKEY_CTX_free(context); }
};

}  // namespace

bool VerifyP256Signature(const P256PublicKey& key, const Sha256Digest& digest, const P256Signature& signature) {
    const std::string keyDer = PublicKeyDer(key);
    const unsigned char* keyBytes = reinterpret_cast<const unsigned char*>(keyDer.data());
    // d2i_PUBKEY refuses a point that does not lie on the curve.
    const std::unique_ptr<EVP_PKEY, KeyFree> publicKey(
        d2i_PUBKEY(nullptr, &keyBytes, static_cast<long>(keyDer.size())));
    if (!publicKey) return false;
    const std::unique_ptr<EVP_PKEY_CTX, ContextFree> context(EVP_PKEY_CTX_new(publicKey.get(), nullptr));
    const std::string der = SignatureDer(signature);
    return context && EVP_PKEY_verify_init(context.get()) == 1 &&
           EVP_PKEY_verify(context.get(), reinterpret_cast<const unsigned char*>(der.data()), der.size(), digest.data(),
                           digest.size()) == 1;
}
