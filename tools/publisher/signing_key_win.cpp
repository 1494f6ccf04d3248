#include <cstring>

#include "base/exception.h"
#include "base/unique_handle_win.h"
#include "net/cng_handles_win.h"
#include "tools/publisher/signing_key.h"

namespace {

// CNG's private blob: its header, X, Y, then the scalar.
constexpr size_t kBlobSize = sizeof(BCRYPT_ECCKEY_BLOB) + 3 * 32;

}  // namespace

P256PrivateKey GenerateSigningKey() {
    const CngAlgorithm algorithm = OpenCngAlgorithm(BCRYPT_ECDSA_P256_ALGORITHM);
    CngKey pair;
    UCHAR blob[kBlobSize];
    ULONG size = 0;
    if (!algorithm || !BCRYPT_SUCCESS(BCryptGenerateKeyPair(algorithm.Get(), pair.Receive(), 256, 0)) ||
        !BCRYPT_SUCCESS(BCryptFinalizeKeyPair(pair.Get(), 0)) ||
        !BCRYPT_SUCCESS(BCryptExportKey(pair.Get(), nullptr, BCRYPT_ECCPRIVATE_BLOB, blob, sizeof blob, &size, 0)) ||
        size != sizeof blob) {
        throw Exception("Cannot make an ECDSA P-256 key.");
    }
    P256PrivateKey key;
    key.publicKey[0] = 0x04;
    std::memcpy(key.publicKey.data() + 1, blob + sizeof(BCRYPT_ECCKEY_BLOB), 64);
    std::memcpy(key.scalar.data(), blob + sizeof(BCRYPT_ECCKEY_BLOB) + 64, 32);
    SecureZeroMemory(blob, sizeof blob);
    return key;
}

P256Signature SignDigest(const P256PrivateKey& key, const Sha256Digest& digest) {
    UCHAR blob[kBlobSize];
    const BCRYPT_ECCKEY_BLOB header{BCRYPT_ECDSA_PRIVATE_P256_MAGIC, 32};
    std::memcpy(blob, &header, sizeof header);
    std::memcpy(blob + sizeof header, key.publicKey.data() + 1, 64);
    std::memcpy(blob + sizeof header + 64, key.scalar.data(), 32);
    const CngAlgorithm algorithm = OpenCngAlgorithm(BCRYPT_ECDSA_P256_ALGORITHM);
    CngKey pair;
    const bool imported =
        algorithm && BCRYPT_SUCCESS(BCryptImportKeyPair(algorithm.Get(), nullptr, BCRYPT_ECCPRIVATE_BLOB,
                                                        pair.Receive(), blob, sizeof blob, 0));
    SecureZeroMemory(blob, sizeof blob);
    P256Signature signature{};
    ULONG size = 0;
    if (!imported ||
        !BCRYPT_SUCCESS(BCryptSignHash(pair.Get(), nullptr, const_cast<UCHAR*>(digest.data()),
                                       static_cast<ULONG>(digest.size()), signature.data(),
                                       static_cast<ULONG>(signature.size()), &size, 0)) ||
        size != signature.size()) {
        throw Exception("Cannot sign with the ECDSA P-256 key.");
    }
    return signature;
}

bool WritePrivateFile(const std::string& path, const std::string& text) {
    // The new file takes the folder's permissions; a user's own folders
    // are closed to other users already.
    bool ok = false;
    {
        const UniqueFileHandle file(
            CreateFileA(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW, FILE_ATTRIBUTE_NORMAL, nullptr));
        if (!file) return false;
        DWORD written = 0;
        ok = WriteFile(file.Get(), text.data(), static_cast<DWORD>(text.size()), &written, nullptr) &&
             written == text.size() && FlushFileBuffers(file.Get());
    }
    if (!ok) DeleteFileA(path.c_str());
    return ok;
}
