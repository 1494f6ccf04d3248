#pragma once

#include <cstdint>

#include <string>

// Adler-32 (RFC 1950), going on from the checksum of what came before
// (1 for nothing). A length of 0 or less gives start; null data throws.
uint32_t Checksum(const uint8_t* data, int64_t length, uint32_t start = 1);
// The Adler-32 of the whole file at path; throws Exception when it cannot
// be read.
uint32_t ChecksumOfFile(const std::string& path);
