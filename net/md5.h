#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

// The MD5 digest (RFC 1321) of text up to its first zero byte, as 32
// lower-case hexadecimal digits; empty when the platform cannot hash.
std::string Md5Hex(const std::string& text);

// The platform's MD5 of size bytes; false when it is unavailable.
bool Md5Digest(const char* data, size_t size, uint8_t (&digest)[16]);
