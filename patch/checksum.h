#pragma once

#include <cstdint>

// Adler-32 (RFC 1950). A length of 0 or less gives 1; null data throws.
uint32_t Checksum(const uint8_t* data, int64_t length);
