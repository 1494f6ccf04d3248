#include <windows.h>

#include <wincrypt.h>

#include "net/md5.h"

namespace {

class CryptoProvider {
public:
    CryptoProvider() {
        if (!CryptAcquireContextA(&handle, nullptr, nullptr, PROV_RSA_FULL, CRYPT_VERIFYCONTEXT)) handle = 0;
    }
    CryptoProvider(const CryptoProvider&) = delete;
    CryptoProvider& operator=(const CryptoProvider&) = delete;
    ~CryptoProvider() {
        if (handle != 0) CryptReleaseContext(handle, 0);
    }
    HCRYPTPROV handle = 0;
};

class CryptoHash {
public:
    explicit CryptoHash(HCRYPTPROV provider) {
        if (!CryptCreateHash(provider, CALG_MD5, 0, 0, &handle)) handle = 0;
    }
    CryptoHash(const CryptoHash&) = delete;
    CryptoHash& operator=(const CryptoHash&) = delete;
    ~CryptoHash() {
        if (handle != 0) CryptDestroyHash(handle);
    }
    HCRYPTHASH handle = 0;
};

}  // namespace

bool Md5Digest(const char* data, size_t size, uint8_t (&digest)[16]) {
    CryptoProvider provider;
    if (provider.handle == 0) return false;
    CryptoHash hash(provider.handle);
    if (hash.handle == 0) return false;
    // CryptHashData takes 32-bit counts; feed larger inputs in pieces.
    const BYTE* bytes = reinterpret_cast<const BYTE*>(data);
    while (size > 0) {
        const DWORD piece = size > 0x40000000 ? 0x40000000 : static_cast<DWORD>(size);
        if (!CryptHashData(hash.handle, bytes, piece, 0)) return false;
        bytes += piece;
        size -= piece;
    }
    DWORD length = sizeof(digest);
    return CryptGetHashParam(hash.handle, HP_HASHVAL, digest, &length, 0) && length == sizeof(digest);
}
