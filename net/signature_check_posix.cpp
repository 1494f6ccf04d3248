#include <openssl/ecdsa.h>
#include <openssl/evp.h>
#include <openssl/x509.h>

#include "net/openssl_handles_posix.h"
#include "net/signature_check.h"

bool VerifyP256Signature(const P256PublicKey& key, const Sha256Digest& digest, const P256Signature& signature) {
    const std::string keyDer = PublicKeyDer(key);
    const unsigned char* keyBytes = reinterpret_cast<const unsigned char*>(keyDer.data());
    // d2i_PUBKEY refuses a point that does not lie on the curve.
    const EvpKey publicKey(d2i_PUBKEY(nullptr, &keyBytes, static_cast<long>(keyDer.size())));
    if (!publicKey) return false;
    const EvpKeyContext context(EVP_PKEY_CTX_new(publicKey.Get(), nullptr));
    const std::string der = SignatureDer(signature);
    return context && EVP_PKEY_verify_init(context.Get()) == 1 &&
           EVP_PKEY_verify(context.Get(), reinterpret_cast<const unsigned char*>(der.data()), der.size(), digest.data(),
                           digest.size()) == 1;
}
