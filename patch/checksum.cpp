#include "patch/checksum.h"

#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"

uint32_t Checksum(const uint8_t* data, int64_t length, uint32_t start) {
    if (data == nullptr) throw Exception("Checksum data");
    constexpr uint32_t kModulus = 65521;
    // 5552 is the largest block for which b cannot overflow 32 bits.
    constexpr int64_t kBlock = 5552;
    uint32_t a = start & 0xFFFF;
    uint32_t b = start >> 16;
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

uint32_t ChecksumOfFile(const std::string& path) {
    FileStream file;
    file.Open(path);
    std::vector<uint8_t> buffer(1 << 20);
    uint32_t checksum = 1;
    while (const uint32_t count = file.Read(buffer.data(), static_cast<uint32_t>(buffer.size()))) {
        checksum = Checksum(buffer.data(), count, checksum);
    }
    return checksum;
}
