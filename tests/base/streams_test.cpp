#include <gtest/gtest.h>

#include <cstring>
#include <tuple>

#include "base/exception.h"
#include "base/memory_stream.h"
#include "base/paths.h"
#include "base/stream_readers.h"
#include "tests/support/test_files.h"

namespace {

TEST(FileStreamTest, OpenModesPositionsSharingAndFailures) {
    TempFolder folder;
    const std::string path = folder / "data.bin";
    WriteTextFile(path, "0123456789XYZ");
    FileStream stream, other;
    stream.OpenForWrite(path);
    stream.Write("ab", 2);
    EXPECT_THROW(other.Open(path), Exception);  // a writer excludes readers
    stream.Open(path);
    EXPECT_NO_THROW(other.Open(path));  // readers share
    uint8_t buffer[8];
    EXPECT_EQ(stream.Read(buffer, 5), 5u);
    EXPECT_EQ(stream.GetPosition(), 0);  // only Seek moves it
    EXPECT_EQ(stream.Seek(-3, 2), 10);
    EXPECT_EQ(stream.ReadByte(), 'X');
    EXPECT_EQ(stream.Seek(0, 2), 13);
    EXPECT_EQ(stream.ReadByte(), -1);
    EXPECT_EQ(ErrorOf([&] { CheckedReadBytes(&stream, buffer, 2); }),
              "CheckedReadBytes: End of stream reached with bytes left to read. File: data.bin Size: 13 (0)");
    EXPECT_THROW(stream.OpenForWrite(path), Exception);  // and readers exclude writers
    other.Close();
    EXPECT_EQ(ReadTextFile(path), "ab23456789XYZ");
    stream.Create(path);
    stream.Close();
    EXPECT_EQ(ReadTextFile(path), "");
    const std::string missing = PathJoin(folder / "missing", "x.bin");
    EXPECT_EQ(ErrorOf([&] { stream.Open(missing); }), "Failed to open file: " + missing + " (0)");
}

TEST(MemoryStreamTest, StaysInsideTheBorrowedBuffer) {
    uint8_t data[8] = {1, 2, 3, 4, 5, 6, 7, 8};
    MemoryStream stream;
    EXPECT_EQ(stream.Seek(5, 0), 0);  // no buffer yet
    stream.Attach(data, 8);
    // From the start, the position and the end, clamped to the buffer.
    for (const auto& [offset, origin, expected] :
         {std::tuple<int64_t, uint32_t, int64_t>{30, 0, 8}, {-5, 1, 3}, {2, 2, 6}, {30, 2, 0}, {3, 7, 0}}) {
        EXPECT_EQ(stream.Seek(offset, origin), expected) << offset << " from " << origin;
    }
    stream.Seek(4, 0);
    EXPECT_EQ(stream.Write("abcdefgh", 8), 4u);  // cut to the room left
    EXPECT_EQ(std::memcmp(data + 4, "abcd", 4), 0);
    EXPECT_THROW(stream.WriteByte('x'), Exception);
    stream.Seek(3, 0);
    stream.WriteByte('z');
    EXPECT_EQ(data[3], 'z');
    // A negative position must not reach memory before the buffer.
    EXPECT_EQ(stream.Seek(-2, 0), -2);
    EXPECT_EQ(stream.ReadByte(), -1);
    EXPECT_EQ(stream.Read(data, 4), 0u);
    EXPECT_THROW(stream.Write("ab", 2), Exception);
    EXPECT_EQ(data[0], 1);
}

TEST(StreamReadersTest, SevenBitIntegersFitIn32Bits) {
    const std::tuple<std::string, uint32_t, const char*> cases[] = {
        {"\x8F\xFF\xFF\xFF\x7F", 0xFFFFFFFFu, ""},
        {std::string("\x90\x80\x80\x80\x00", 5), 0, "Encoded integer does not fit in 32 bits."},  // not truncated
        {"\x80\x80\x80\x80\x80", 0, "Invalid 7-bit encoded integer in stream."},
    };
    for (const auto& [encoded, expected, outcome] : cases) {
        std::string bytes = encoded;
        MemoryStream stream;
        stream.Attach(reinterpret_cast<uint8_t*>(&bytes[0]), static_cast<int32_t>(bytes.size()));
        uint32_t value = 0;
        const std::string error = ErrorOf([&] { value = ReadBigEndian7BitEncodedInt(&stream); });
        EXPECT_TRUE(*outcome ? error.find(outcome) != error.npos : error.empty()) << error;
        EXPECT_EQ(value, expected);
    }
}

}  // namespace
