#pragma once

#include "base/file_stream.h"

// A window onto a buffer that somebody else owns; never allocates, copies
// or frees it. Reads past the end give nothing; writes past the end are
// cut to the room left.
class MemoryStream : public FileStream {
public:
    MemoryStream() = default;
    ~MemoryStream() override = default;

    void Create(const std::string&) override {}
    void Open(const std::string&) override {}
    void OpenForWrite(const std::string&) override {}
    void Close() override;
    int64_t Seek(int64_t offset, uint32_t origin) override;
    int64_t GetPosition() override { return position; }
    int64_t GetLength() override { return length; }
    int32_t ReadByte() override;
    uint32_t Read(void* destination, uint32_t count) override;
    uint32_t Write(const void* source, uint32_t count) override;
    void WriteByte(uint8_t value) override;
    void Attach(uint8_t* buffer, int32_t size) override;
    void Flush() override {}

    // The buffer itself, for decoders that copy within a window.
    uint8_t* Data() const { return buffer; }

private:
    // Bytes available from the position, or 0 when the position lies
    // outside the buffer (a negative Seek can put it before the start).
    int64_t Remaining() const;

    uint8_t* buffer = nullptr;
    int64_t position = 0;
    int64_t length = 0;
};
