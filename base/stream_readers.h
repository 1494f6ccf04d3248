#pragma once

#include <cstdint>

class FileStream;

// Exact readers: each either delivers what was asked or throws an
// Exception naming the stream and its length.

// Reads exactly count bytes into buffer and returns buffer.
uint8_t* CheckedReadBytes(FileStream* stream, uint8_t* buffer, int32_t count);
uint8_t CheckedReadByte(FileStream* stream);
// The variable-length integer of RFC 3284, most significant group first.
// Values that do not fit in 32 bits are rejected, not truncated.
uint32_t ReadBigEndian7BitEncodedInt(FileStream* stream);
