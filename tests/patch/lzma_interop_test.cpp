// Members whose LZMA data comes from the peer tools (xz, Python's lzma, the
// SDK encoder), found and unpacked through PatchArchive.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <memory>
#include <string>

#include "base/file_stream.h"
#include "base/memory_stream.h"
#include "patch/patch_archive.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"
#include "tools/publisher/archive_writer.h"

namespace {

TEST(LzmaInterop, UnpacksMembersMadeByXzPythonAndTheSdk) {
    TempFolder folder;
    const std::string text = FixtureText();
    std::string textCopy = text;
    MemoryStream source;
    source.Attach(reinterpret_cast<uint8_t*>(&textCopy[0]), static_cast<int32_t>(textCopy.size()));
    std::string nothing;
    MemoryStream emptySource;
    emptySource.Attach(reinterpret_cast<uint8_t*>(&nothing[0]), 0);

    const std::string archivePath = folder / "interop.pak";
    {
        ArchiveWriter writer(archivePath);
        writer.AddStoredMember("data\\xz.txt", ReadFixture("text.xz.lzma"));
        writer.AddStoredMember("data\\python.txt", ReadFixture("text.python.lzma"));
        writer.AddStoredMember("data\\python-lc0lp2pb0.txt", ReadFixture("text.python-lc0lp2pb0.lzma"));
        writer.AddStoredMember("empty-xz", ReadFixture("empty.xz.lzma"));
        writer.AddStoredMember("empty-python", ReadFixture("empty.python.lzma"));
        writer.AddMember("data\\sdk.txt", source);
        writer.AddMember("empty-sdk", emptySource);
        writer.Close();
    }
    const struct {
        const char* member;
        const std::string& expected;
    } cases[] = {
        {"data\\xz.txt", text},  {"data\\python.txt", text}, {"data\\python-lc0lp2pb0.txt", text},
        {"data\\sdk.txt", text}, {"empty-xz", nothing},      {"empty-python", nothing},
        {"empty-sdk", nothing},
    };
    PatchArchive archive(archivePath);
    for (const auto& c : cases) {
        SCOPED_TRACE(c.member);
        const std::string out = folder / "out.bin";
        archive.DecodeFile(c.member, out);
        EXPECT_EQ(ReadTextFile(out), c.expected);
    }
}

// Bytes of a large member, made on the fly so the test holds no 100 MiB
// buffer: words with a slowly drifting offset, so matches are long but the
// data is not one repeated run.
uint8_t PatternByte(uint64_t i) {
    static const char kWords[] = "ironvale west patch member ";
    return static_cast<uint8_t>(kWords[(i + (i >> 14)) % (sizeof(kWords) - 1)] + ((i >> 20) & 3));
}

class PatternSource : public FileStream {
public:
    explicit PatternSource(uint64_t total) : size(total) {}
    int64_t Seek(int64_t offset, uint32_t) override { return position = static_cast<uint64_t>(offset); }
    int64_t GetLength() override { return static_cast<int64_t>(size); }
    uint32_t Read(void* destination, uint32_t count) override {
        const uint32_t n = static_cast<uint32_t>(std::min<uint64_t>(count, size - position));
        uint8_t* bytes = static_cast<uint8_t*>(destination);
        for (uint32_t i = 0; i < n; ++i) bytes[i] = PatternByte(position + i);
        position += n;
        return n;
    }

private:
    uint64_t size;
    uint64_t position = 0;
};

TEST(LzmaInterop, UnpacksAHundredMebibyteMember) {
    constexpr uint64_t kSize = 100ull << 20;
    TempFolder folder;
    const std::string archivePath = folder / "big.pak";
    {
        ArchiveWriter writer(archivePath);
        PatternSource source(kSize);
        LzmaOptions fast;
        fast.level = 1;
        writer.AddMember("big.bin", source, fast);
        writer.AddStoredMember("after", ReadFixture("text.xz.lzma"));
        writer.Close();
    }
    const std::string out = folder / "big.bin";
    PatchArchive(archivePath).DecodeFile("big.bin", out);
    FileStream result;
    result.Open(out);
    ASSERT_EQ(result.GetLength(), static_cast<int64_t>(kSize));
    std::unique_ptr<uint8_t[]> chunk(new uint8_t[1 << 20]);
    for (uint64_t offset = 0; offset < kSize;) {
        const uint32_t n = result.Read(chunk.get(), 1 << 20);
        ASSERT_GT(n, 0u);
        for (uint32_t i = 0; i < n; ++i) {
            if (chunk[i] != PatternByte(offset + i)) FAIL() << "first difference at byte " << offset + i;
        }
        offset += n;
    }
    result.Close();
    // The scan walks past the big member to the one behind it.
    PatchArchive(archivePath).DecodeFile("after", out);
    EXPECT_EQ(ReadTextFile(out), FixtureText());
}

// Member sizes are 40 bits: a member of more than 4 GiB must be skipped by
// its full size, not by what fits in 32 bits. The file is sparse.
TEST(LzmaInterop, SkipsMembersLargerThanFourGibibytes) {
    TempFolder folder;
    const std::string archivePath = folder / "huge.pak";
    const uint64_t hugeSize = (5ull << 30) + 17;
    std::string header = std::string(1, '\4') + "huge";
    for (int i = 0; i < 5; ++i) header += static_cast<char>(hugeSize >> (8 * i));
    WriteTextFile(archivePath, header);
    std::filesystem::resize_file(archivePath, header.size() + hugeSize);
    const std::string after = ReadFixture("text.python.lzma");
    std::string tail = std::string(1, '\5') + "after";
    for (int i = 0; i < 5; ++i) tail += static_cast<char>(static_cast<uint64_t>(after.size()) >> (8 * i));
    {
        FileStream append;
        append.OpenForWrite(archivePath);
        append.Seek(0, 2);
        const std::string bytes = tail + after;
        append.Write(bytes.data(), static_cast<uint32_t>(bytes.size()));
    }
    const std::string out = folder / "after.txt";
    PatchArchive(archivePath).DecodeFile("after", out);
    EXPECT_EQ(ReadTextFile(out), FixtureText());
}

}  // namespace
