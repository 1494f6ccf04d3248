#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

class CancellationToken;

using Sha256Digest = std::array<uint8_t, 32>;

// SHA-256 (FIPS 180-4) through the platform: CNG on Windows, OpenSSL
// elsewhere. Fed piece by piece, so a file of any size is hashed in a
// fixed buffer.
class Sha256 {
public:
    // Throws Exception when the platform cannot hash.
    Sha256();
    Sha256(const Sha256&) = delete;
    Sha256& operator=(const Sha256&) = delete;
    virtual ~Sha256();

    void Update(const void* data, size_t size);
    // The digest of everything fed so far; the object is spent afterwards.
    Sha256Digest Finish();

private:
    struct State;
    std::unique_ptr<State> state;
};

// Lower-case hexadecimal digits, two per byte.
std::string HexDigits(const uint8_t* bytes, size_t count);

// Hashes the file at path and reports its length in bytes. False when the
// file cannot be read, or when stop (may be null) was cancelled before the
// end (a large archive takes seconds).
[[nodiscard]] bool Sha256OfFile(const std::string& path, Sha256Digest& digest, int64_t& length,
                                const CancellationToken* stop = nullptr);
