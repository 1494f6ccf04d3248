#include "base/memory_stream.h"

#include <algorithm>
#include <cstring>

#include "base/exception.h"

void MemoryStream::Close() {
    buffer = nullptr;
    position = 0;
    length = 0;
}

void MemoryStream::Attach(uint8_t* data, int32_t size) {
    Close();
    if (data != nullptr) {
        buffer = data;
        length = size;
    }
}

int64_t MemoryStream::Seek(int64_t offset, uint32_t origin) {
    if (buffer == nullptr) return 0;
    switch (origin) {
        case 0:
            position = std::min(offset, length);
            break;
        case 1:
            position = std::min(position + offset, length);
            break;
        case 2:
            position = std::max<int64_t>(length - offset, 0);
            break;
        default:
            return 0;
    }
    return position;
}

int64_t MemoryStream::Remaining() const {
    if (buffer == nullptr || position < 0 || position >= length) return 0;
    return length - position;
}

int32_t MemoryStream::ReadByte() {
    if (Remaining() < 1) return -1;
    return buffer[position++];
}

uint32_t MemoryStream::Read(void* destination, uint32_t count) {
    const int64_t n = std::min<int64_t>(count, Remaining());
    if (destination == nullptr || n <= 0) return 0;
    std::memcpy(destination, buffer + position, static_cast<size_t>(n));
    position += n;
    return static_cast<uint32_t>(n);
}

uint32_t MemoryStream::Write(const void* source, uint32_t count) {
    const int64_t n = std::min<int64_t>(count, Remaining());
    if (source == nullptr || n <= 0) throw Exception("Failed to write data to stream.");
    std::memmove(buffer + position, source, static_cast<size_t>(n));
    position += n;
    return static_cast<uint32_t>(n);
}

void MemoryStream::WriteByte(uint8_t value) {
    if (Remaining() < 1) throw Exception("Failed to write data to stream.");
    buffer[position++] = value;
}
