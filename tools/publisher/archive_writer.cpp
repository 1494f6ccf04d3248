#include "tools/publisher/archive_writer.h"

#include <algorithm>
#include <vector>

#include "base/exception.h"

namespace {

constexpr uint64_t kMaximumDataSize = (uint64_t{1} << 40) - 1;

}  // namespace

ArchiveWriter::ArchiveWriter(const std::string& archivePath) { archive.Create(archivePath); }

void ArchiveWriter::WriteBytes(const void* data, size_t size) {
    const uint8_t* bytes = static_cast<const uint8_t*>(data);
    while (size > 0) {
        const uint32_t piece = static_cast<uint32_t>(std::min<size_t>(size, 1u << 30));
        const uint32_t done = archive.Write(bytes, piece);
        if (done == 0) throw Exception("Failed to write data to file.");
        bytes += done;
        size -= done;
        position += done;
    }
}

void ArchiveWriter::WriteHeader(const std::string& name, uint64_t dataSize) {
    if (name.size() > 255) throw Exception("Member name longer than 255 bytes: " + name);
    if (dataSize > kMaximumDataSize) throw Exception("Member larger than an archive can describe: " + name);
    uint8_t header[1 + 255 + 5];
    header[0] = static_cast<uint8_t>(name.size());
    std::copy(name.begin(), name.end(), header + 1);
    for (int i = 0; i < 5; ++i) header[1 + name.size() + i] = static_cast<uint8_t>(dataSize >> (8 * i));
    WriteBytes(header, 1 + name.size() + 5);
}

void ArchiveWriter::AddMember(const std::string& name, FileStream& source, const LzmaOptions& options) {
    const int64_t length = source.GetLength();
    source.Seek(0, 0);
    // The data size is known only once the encoder is done: write a
    // placeholder, compress, then come back for it.
    const int64_t headerStart = position;
    WriteHeader(name, 0);
    const int64_t dataStart = position;
    EncodeLzma(source, static_cast<uint64_t>(length), options,
               [this](const uint8_t* data, size_t size) { WriteBytes(data, size); });
    const int64_t dataEnd = position;
    archive.Seek(headerStart, 0);
    WriteHeader(name, static_cast<uint64_t>(dataEnd - dataStart));
    archive.Seek(dataEnd, 0);
    position = dataEnd;
}

void ArchiveWriter::AddStoredMember(const std::string& name, const std::string& data) {
    WriteHeader(name, data.size());
    WriteBytes(data.data(), data.size());
}

void ArchiveWriter::AddStoredMember(const std::string& name, FileStream& data) {
    const int64_t length = data.GetLength();
    data.Seek(0, 0);
    WriteHeader(name, static_cast<uint64_t>(length));
    std::vector<uint8_t> buffer(1 << 16);
    for (int64_t left = length; left > 0;) {
        const uint32_t read = data.Read(buffer.data(), static_cast<uint32_t>(std::min<int64_t>(left, buffer.size())));
        if (read == 0) throw Exception("Failed to read data from file.");
        WriteBytes(buffer.data(), read);
        left -= read;
    }
}

void ArchiveWriter::Close() { archive.Close(); }
