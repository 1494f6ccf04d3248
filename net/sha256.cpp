#include "net/sha256.h"

#include <vector>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"

namespace {

// Large enough that the hash, not the calls, sets the pace.
constexpr uint32_t kReadPiece = 1024 * 1024;

}  // namespace

std::string HexDigits(const uint8_t* bytes, size_t count) {
    static const char kDigits[] = "0123456789abcdef";
    std::string hex;
    hex.reserve(count * 2);
    for (size_t i = 0; i < count; ++i) {
        hex += kDigits[bytes[i] >> 4];
        hex += kDigits[bytes[i] & 0x0F];
    }
    return hex;
}

bool Sha256OfFile(const std::string& path, Sha256Digest& digest, int64_t& length, const CancellationToken* stop) {
    try {
        FileStream file;
        file.Open(path);
        Sha256 hash;
        std::vector<uint8_t> buffer(kReadPiece);
        length = 0;
        for (;;) {
            if (IsCancelled(stop)) return false;
            const uint32_t count = file.Read(buffer.data(), kReadPiece);
            if (count == 0) break;
            hash.Update(buffer.data(), count);
            length += count;
        }
        digest = hash.Finish();
        return true;
    } catch (const Exception&) {
        return false;
    }
}
