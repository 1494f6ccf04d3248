// ironvale-patch archive list|extract|pack: look into, unpack from and make
// patch archives.
#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/stream_readers.h"
#include "patch/patch_archive.h"
#include "tools/ironvale_patch/command.h"
#include "tools/publisher/archive_writer.h"

namespace {

const char kUsage[] =
    "archive list ARCHIVE | archive extract ARCHIVE MEMBER OUT | archive pack [--level=N] OUT NAME=FILE...";

// The unpacked size from the member's LZMA header, or -1 when the stream
// does not give it (it ends with an end marker) or is too short to say.
int64_t UnpackedSize(FileStream& archive, const ArchiveMember& member) {
    if (member.dataSize < 13) return -1;
    archive.Seek(member.dataOffset + 5, 0);
    uint8_t size[8];
    CheckedReadBytes(&archive, size, 8);
    uint64_t value = 0;
    for (int i = 7; i >= 0; --i) value = (value << 8) | size[i];
    return value > static_cast<uint64_t>(INT64_MAX) ? -1 : static_cast<int64_t>(value);
}

int List(const std::string& path) {
    FileStream archive;
    archive.Open(path);
    const int64_t length = archive.GetLength();
    int64_t offset = 0;
    ArchiveMember member;
    std::printf("%-12s %-12s %s\n", "packed", "unpacked", "name");
    while (ReadArchiveMember(archive, offset, length, member)) {
        const int64_t unpacked = UnpackedSize(archive, member);
        const std::string unpackedText = unpacked < 0 ? "unknown" : std::to_string(unpacked);
        std::printf("%-12lld %-12s %s\n", static_cast<long long>(member.dataSize), unpackedText.c_str(),
                    member.name.c_str());
        offset = member.dataOffset + member.dataSize;
    }
    if (offset != length) {
        std::fprintf(stderr, "ironvale-patch: broken member header at offset %lld\n", static_cast<long long>(offset));
        return 1;
    }
    return 0;
}

int Pack(std::vector<std::string> args) {
    LzmaOptions options;
    if (!args.empty() && args[0].rfind("--level=", 0) == 0) {
        const std::string level = args[0].substr(8);
        if (level.size() != 1 || level[0] < '0' || level[0] > '9') return UsageError(kUsage);
        options.level = level[0] - '0';
        args.erase(args.begin());
    }
    if (args.size() < 2) return UsageError(kUsage);
    ArchiveWriter writer(args[0]);
    for (size_t i = 1; i < args.size(); ++i) {
        const size_t equals = args[i].find('=');
        if (equals == std::string::npos || equals == 0) return UsageError(kUsage);
        FileStream source;
        source.Open(args[i].substr(equals + 1));
        writer.AddMember(args[i].substr(0, equals), source, options);
    }
    writer.Close();
    return 0;
}

int Run(const std::vector<std::string>& args) {
    if (args.size() == 2 && args[0] == "list") return List(args[1]);
    if (args.size() == 4 && args[0] == "extract") {
        PatchArchive(args[1]).DecodeFile(args[2], args[3]);
        return 0;
    }
    if (!args.empty() && args[0] == "pack") return Pack(std::vector<std::string>(args.begin() + 1, args.end()));
    return UsageError(kUsage);
}

const CommandRegistration registration("archive", kUsage, Run);

}  // namespace
