#include "base/stream_readers.h"

#include <string>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"

namespace {

[[noreturn]] void Fail(FileStream* stream, const char* what) {
    throw Exception(std::string(what) + " File: " + GetFileName(stream->GetName()) +
                    " Size: " + std::to_string(stream->GetLength()));
}

}  // namespace

uint8_t* CheckedReadBytes(FileStream* stream, uint8_t* buffer, int32_t count) {
    int32_t done = 0;
    while (done < count) {
        const uint32_t n = stream->Read(buffer + done, static_cast<uint32_t>(count - done));
        if (n == 0) Fail(stream, "CheckedReadBytes: End of stream reached with bytes left to read.");
        done += static_cast<int32_t>(n);
    }
    return buffer;
}

uint8_t CheckedReadByte(FileStream* stream) {
    const int32_t value = stream->ReadByte();
    if (value < 0) Fail(stream, "CheckedReadByte: Expected to be able to read a byte.");
    return static_cast<uint8_t>(value);
}

uint32_t ReadBigEndian7BitEncodedInt(FileStream* stream) {
    uint64_t value = 0;
    for (int i = 0; i < 5; ++i) {
        const int32_t byte = stream->ReadByte();
        if (byte < 0) Fail(stream, "ReadBigEndian7BitEncodedInt: End of stream reached with bytes left to read.");
        value = (value << 7) | static_cast<uint32_t>(byte & 0x7F);
        if ((byte & 0x80) == 0) {
            if (value > 0xFFFFFFFFu) {
                Fail(stream, "ReadBigEndian7BitEncodedInt: Encoded integer does not fit in 32 bits.");
            }
            return static_cast<uint32_t>(value);
        }
    }
    Fail(stream, "ReadBigEndian7BitEncodedInt: Invalid 7-bit encoded integer in stream.");
}
