#include "patch/patch_archive.h"

#include "base/exception.h"
#include "base/log.h"
#include "base/stream_readers.h"
#include "patch/lzma_decoder.h"

namespace {

constexpr int kSizeBytes = 5;

}  // namespace

bool ReadArchiveMember(FileStream& archive, int64_t offset, int64_t length, ArchiveMember& member) {
    if (offset < 0 || length - offset < 1 + kSizeBytes) return false;
    // Every read below is checked against the length first, so the exact
    // readers can only fail if the file shrinks under us.
    archive.Seek(offset, 0);
    const uint8_t nameLength = CheckedReadByte(&archive);
    const int64_t dataOffset = offset + 1 + nameLength + kSizeBytes;
    if (dataOffset > length) return false;
    uint8_t rest[255 + kSizeBytes];
    CheckedReadBytes(&archive, rest, nameLength + kSizeBytes);
    int64_t dataSize = 0;
    for (int i = kSizeBytes - 1; i >= 0; --i) dataSize = (dataSize << 8) | rest[nameLength + i];
    if (dataSize > length - dataOffset) return false;
    member.name.assign(reinterpret_cast<const char*>(rest), nameLength);
    member.dataOffset = dataOffset;
    member.dataSize = dataSize;
    return true;
}

PatchArchive::PatchArchive(const std::string& path) : archivePath(path) {}

void PatchArchive::DecodeFile(const std::string& memberName, const std::string& destinationPath,
                              const CancellationToken* cancel, MemoryBudget* budget) {
    FileStream destination;
    destination.Create(destinationPath);
    archive.Open(archivePath);
    // Closed on every way out, so a failed member does not keep the archive
    // locked against the downloader or the clean-up.
    struct CloseArchive {
        FileStream& stream;
        ~CloseArchive() { stream.Close(); }
    } closeArchive{archive};
    if (!FindMember(memberName)) throw Exception("Failed to find file in patch archive. File: " + memberName);
    // The line number is part of the log format support staff grep for.
    LogEntry(LogLevel::Trace, "PatchArchive", 28).Stream() << "Decoding file: " << memberName;
    DecodeLzma(archive, destination, cancel, budget);
}

bool PatchArchive::FindMember(const std::string& memberName) {
    const int64_t length = archive.GetLength();
    int64_t offset = archive.Seek(0, 1);
    ArchiveMember member;
    while (ReadArchiveMember(archive, offset, length, member)) {
        if (member.name == memberName) {
            if (member.dataSize == 0) return false;
            archive.Seek(member.dataOffset, 0);
            return true;
        }
        offset = member.dataOffset + member.dataSize;
    }
    return false;
}
