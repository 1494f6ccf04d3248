#include "patch/checksum.h"

#include "base/exception.h"

uint32_t Checksum(const uint8_t* data, int64_t length) {
    if (data == nullptr) throw Exception("Checksum data");
    constexpr uint32_t kModulus = 65521;
    // 5552 is the largest block for which b cannot overflow 32 bits.
    constexpr int64_t kBlock = 5552;
    uint32_t a = 1;
    uint32_t b = 0;
    while (length > 0) {
        const int64_t block = length < kBlock ? length : kBlock;
        for (int64_t i = 0; i < block; ++i) {
            a += data[i];
            b += a;
        }
        a %= kModulus;
        b %= kModulus;
        data += block;
        length -= block;
    }
    return (b << 16) | a;
}
