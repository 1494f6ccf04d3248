#include "base/exception.h"
#include "net/cng_handles_win.h"
#include "net/sha256.h"

struct Sha256::State {
    CngAlgorithm algorithm = OpenCngAlgorithm(BCRYPT_SHA256_ALGORITHM);
    CngHash hash;
};

Sha256::Sha256() : state(new State) {
    // CNG keeps the hash object itself when given no buffer (Windows 7 on).
    if (!state->algorithm ||
        !BCRYPT_SUCCESS(BCryptCreateHash(state->algorithm.Get(), state->hash.Receive(), nullptr, 0, nullptr, 0, 0))) {
        throw Exception("SHA-256 is not available.");
    }
}

Sha256::~Sha256() = default;

void Sha256::Update(const void* data, size_t size) {
    // CNG takes 32-bit counts; larger inputs go in pieces.
    const UCHAR* bytes = static_cast<const UCHAR*>(data);
    while (size > 0) {
        const ULONG piece = size > 0x40000000 ? 0x40000000 : static_cast<ULONG>(size);
        if (!BCRYPT_SUCCESS(BCryptHashData(state->hash.Get(), const_cast<UCHAR*>(bytes), piece, 0))) {
            throw Exception("SHA-256 failed.");
        }
        bytes += piece;
        size -= piece;
    }
}

Sha256Digest Sha256::Finish() {
    Sha256Digest digest{};
    if (!BCRYPT_SUCCESS(BCryptFinishHash(state->hash.Get(), digest.data(), static_cast<ULONG>(digest.size()), 0))) {
        throw Exception("SHA-256 failed.");
    }
    return digest;
}
