#pragma once

#include <cstdint>
#include <string>

#include "base/native_handle.h"

// One byte-stream interface over files and borrowed buffers. Reads and
// writes never move the position reported by GetPosition: it is the result
// of the last Seek only. Callers rely on that to know where a scan started.
class FileStream {
public:
    FileStream() = default;
    FileStream(const FileStream&) = delete;
    FileStream& operator=(const FileStream&) = delete;
    virtual ~FileStream();

    // Creates (or empties) the file for writing, exclusively.
    virtual void Create(const std::string& path);
    // Opens an existing file for reading; others may read too.
    virtual void Open(const std::string& path);
    // Opens or creates the file for writing without truncating it.
    virtual void OpenForWrite(const std::string& path);
    virtual void Close();
    // origin: 0 begin, 1 current, 2 end.
    virtual int64_t Seek(int64_t offset, uint32_t origin);
    virtual int64_t GetPosition();
    virtual int64_t GetLength();
    // 0..255, or -1 at the end.
    virtual int32_t ReadByte();
    virtual uint32_t Read(void* destination, uint32_t count);
    virtual uint32_t Write(const void* source, uint32_t count);
    virtual void WriteByte(uint8_t value);
    virtual void Attach(uint8_t* buffer, int32_t size);
    const std::string& GetName() const { return name; }

    // Forces written data to the disk (used before a file is relied on
    // after a crash). Does nothing for memory streams.
    virtual void Flush();

    bool IsOpen() const { return handle.IsOpen(); }

private:
    void OpenWith(const std::string& path, NativeHandle::Mode mode, const char* failure);

    NativeHandle handle;
    int64_t position = 0;
    // Where the next read or write happens (the system's file pointer),
    // which, unlike position, reads and writes move.
    int64_t filePointer = 0;
    std::string name;
};

// Reads the whole file at path into bytes, once: what is read is what the
// caller checks and uses. False when it cannot be read or holds more than
// limit bytes (then nothing of it is read).
[[nodiscard]] bool ReadFileBytes(const std::string& path, int64_t limit, std::string& bytes);

// The length in bytes of the file at path; -1 when it cannot be opened.
int64_t GetFileLength(const std::string& path);
