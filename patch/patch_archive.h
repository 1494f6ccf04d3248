#pragma once

#include <cstdint>
#include <string>

#include "base/file_stream.h"

class CancellationToken;
class MemoryBudget;

// One member of a patch archive as its header describes it. An archive is
// nothing but members back to back: a name length byte, the name, the data
// size as 40 bits least significant byte first, and the LZMA data.
struct ArchiveMember {
    std::string name;
    int64_t dataOffset = 0;
    int64_t dataSize = 0;
};

// Reads the member header at offset of an archive whose length is known.
// False when no complete member starts there: fewer than 6 bytes left, or
// a name or data size running past the end of the file (a truncated or
// hostile archive). Nothing outside the file is read.
bool ReadArchiveMember(FileStream& archive, int64_t offset, int64_t length, ArchiveMember& member);

// Extracts named members of one patch archive into files of their own.
class PatchArchive {
public:
    explicit PatchArchive(const std::string& archivePath);
    PatchArchive(const PatchArchive&) = delete;
    PatchArchive& operator=(const PatchArchive&) = delete;
    virtual ~PatchArchive() = default;

    // Creates (or empties) destinationPath, then decodes the first member
    // named memberName into it. Throws Exception on every failure (a
    // cancel, when cancel is given, is one); a member that is not found
    // leaves the destination empty.
    void DecodeFile(const std::string& memberName, const std::string& destinationPath,
                    const CancellationToken* cancel = nullptr, MemoryBudget* budget = nullptr);

    // Scans the open archive from its start for the first member named
    // memberName (byte for byte, case counts) and leaves the stream at its
    // data. False when there is none, when its data is empty, or when the
    // scan meets a broken header first.
    bool FindMember(const std::string& memberName);

private:
    std::string archivePath;
    FileStream archive;
};
