#include <cstring>

#include "net/cng_handles_win.h"
#include "net/signature_check.h"

bool VerifyP256Signature(const P256PublicKey& key, const Sha256Digest& digest, const P256Signature& signature) {
    const CngAlgorithm algorithm = OpenCngAlgorithm(BCRYPT_ECDSA_P256_ALGORITHM);
    if (!algorithm) return false;
    // CNG's public blob: its header, then X and Y without the 0x04 prefix.
    UCHAR blob[sizeof(BCRYPT_ECCKEY_BLOB) + 64];
    const BCRYPT_ECCKEY_BLOB header{BCRYPT_ECDSA_PUBLIC_P256_MAGIC, 32};
    std::memcpy(blob, &header, sizeof header);
    std::memcpy(blob + sizeof header, key.data() + 1, 64);
    CngKey publicKey;
    if (!BCRYPT_SUCCESS(BCryptImportKeyPair(algorithm.Get(), nullptr, BCRYPT_ECCPUBLIC_BLOB, publicKey.Receive(), blob,
                                            sizeof blob, 0))) {
        return false;
    }
    return BCRYPT_SUCCESS(BCryptVerifySignature(publicKey.Get(), nullptr, const_cast<UCHAR*>(digest.data()),
                                                static_cast<ULONG>(digest.size()), const_cast<UCHAR*>(signature.data()),
                                                static_cast<ULONG>(signature.size()), 0));
}
