#include <windows.h>

#include <wincrypt.h>

#include "base/unique_handle.h"
#include "net/md5.h"

namespace {

struct CryptoProviderTraits {
    using Value = HCRYPTPROV;
    static Value Invalid() { return 0; }
    static void Close(Value value) { CryptReleaseContext(value, 0); }
};

struct CryptoHashTraits {
    using Value = HCRYPTHASH;
    static Value Invalid() { return 0; }
    static void Close(Value value) { CryptDestroyHash(value); }
};

}  // namespace

bool Md5Digest(const char* data, size_t size, uint8_t (&digest)[16]) {
    // A failed call may leave anything in its out value: only success is owned.
    HCRYPTPROV acquired = 0;
    if (!CryptAcquireContextA(&acquired, nullptr, nullptr, PROV_RSA_FULL, CRYPT_VERIFYCONTEXT)) return false;
    const UniqueHandle<CryptoProviderTraits> provider(acquired);
    HCRYPTHASH created = 0;
    if (!CryptCreateHash(provider.Get(), CALG_MD5, 0, 0, &created)) return false;
    const UniqueHandle<CryptoHashTraits> hash(created);
    // CryptHashData takes 32-bit counts; feed larger inputs in pieces.
    const BYTE* bytes = reinterpret_cast<const BYTE*>(data);
    while (size > 0) {
        const DWORD piece = size > 0x40000000 ? 0x40000000 : static_cast<DWORD>(size);
        if (!CryptHashData(hash.Get(), bytes, piece, 0)) return false;
        bytes += piece;
        size -= piece;
    }
    DWORD length = sizeof(digest);
    return CryptGetHashParam(hash.Get(), HP_HASHVAL, digest, &length, 0) && length == sizeof(digest);
}
