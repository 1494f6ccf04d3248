#include "net/md5.h"

#include <cstring>

std::string Md5Hex(const std::string& text) {
    // The digest covers the text as a C string: up to the first zero byte.
    uint8_t digest[16];
    if (!Md5Digest(text.c_str(), std::strlen(text.c_str()), digest)) return std::string();
    static const char kDigits[] = "0123456789abcdef";
    std::string hex;
    hex.reserve(32);
    for (const uint8_t byte : digest) {
        hex += kDigits[byte >> 4];
        hex += kDigits[byte & 0x0F];
    }
    return hex;
}
