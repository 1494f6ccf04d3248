#pragma once

#include <cstdint>
#include <string>

#include "base/file_stream.h"
#include "tools/publisher/lzma_encoder.h"

// Writes a patch archive member by member: a name length byte, the name,
// the 40-bit data size and the LZMA data (here always from the SDK encoder
// with the unpacked size stored, unless ready-made data is given).
class ArchiveWriter {
public:
    // Creates (or empties) the archive file.
    explicit ArchiveWriter(const std::string& archivePath);
    ArchiveWriter(const ArchiveWriter&) = delete;
    ArchiveWriter& operator=(const ArchiveWriter&) = delete;
    virtual ~ArchiveWriter() = default;

    // Compresses everything source holds (GetLength bytes from its start)
    // as the member called name. Names are at most 255 bytes.
    void AddMember(const std::string& name, FileStream& source, const LzmaOptions& options = LzmaOptions());
    // Stores already compressed data (a stand-alone LZMA stream, or
    // anything at all for tests of broken archives) as the member.
    void AddStoredMember(const std::string& name, const std::string& data);
    // The same for data held in a file (its whole content), copied in
    // pieces so a large member never sits in memory.
    void AddStoredMember(const std::string& name, FileStream& data);
    // Bytes written so far.
    int64_t Size() const { return position; }
    void Close();

private:
    void WriteHeader(const std::string& name, uint64_t dataSize);
    void WriteBytes(const void* data, size_t size);

    FileStream archive;
    int64_t position = 0;
};
