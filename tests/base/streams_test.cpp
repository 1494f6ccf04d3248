#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/memory_stream.h"
#include "base/paths.h"
#include "base/stream_readers.h"
#include "tests/support/test_files.h"

namespace {

std::string ThrownMessage(const std::function<void()>& action) {
    try {
        action();
    } catch (const Exception& error) {
        return error.message;
    }
    return "<nothing thrown>";
}

TEST(ExceptionTest, CarriesMessageWideTextAndCode) {
    const Exception plain("x");
    EXPECT_EQ(plain.code, 0);
    EXPECT_EQ(plain.wideMessage, L"x");
    const Exception coded("Corrupt installation.", ErrorCode::CorruptData);
    EXPECT_EQ(coded.code, 12);
    const Exception copy = coded;
    EXPECT_EQ(copy.message, "Corrupt installation.");
    EXPECT_EQ(copy.wideMessage, L"Corrupt installation.");
    EXPECT_EQ(copy.Code(), ErrorCode::CorruptData);
}

TEST(FileStreamTest, ReadsAndWritesDoNotMoveTheReportedPosition) {
    TempFolder folder;
    const std::string path = folder / "data.bin";
    WriteTextFile(path, std::string(200, 'a') + "XYZ");
    FileStream stream;
    stream.Open(path);
    std::vector<uint8_t> buffer(100);
    EXPECT_EQ(stream.Read(buffer.data(), 100), 100u);
    EXPECT_EQ(stream.GetPosition(), 0);
    EXPECT_EQ(stream.Seek(10, 0), 10);
    EXPECT_EQ(stream.GetPosition(), 10);
    EXPECT_EQ(stream.Seek(-3, 2), 200);
    EXPECT_EQ(stream.ReadByte(), 'X');
    EXPECT_EQ(stream.GetLength(), 203);
    EXPECT_EQ(stream.Seek(0, 2), 203);
    EXPECT_EQ(stream.ReadByte(), -1);
    EXPECT_EQ(stream.Read(buffer.data(), 10), 0u);
}

TEST(FileStreamTest, CreateTruncatesAndOpenForWriteKeepsContent) {
    TempFolder folder;
    const std::string path = folder / "out.bin";
    WriteTextFile(path, "0123456789");
    {
        FileStream stream;
        stream.OpenForWrite(path);
        EXPECT_EQ(stream.Write("ab", 2), 2u);
    }
    EXPECT_EQ(ReadTextFile(path), "ab23456789");
    {
        FileStream stream;
        stream.Create(path);
        stream.Write("new", 3);
        EXPECT_EQ(stream.GetName(), path);
    }
    EXPECT_EQ(ReadTextFile(path), "new");
}

TEST(FileStreamTest, FailuresThrowTheirTextsAndKeepTheName) {
    TempFolder folder;
    const std::string missing = PathJoin(folder / "missing", "x.bin");
    FileStream stream;
    EXPECT_EQ(ThrownMessage([&] { stream.Open(missing); }), "Failed to open file: " + missing);
    EXPECT_EQ(stream.GetName(), missing);
    EXPECT_FALSE(stream.IsOpen());
    EXPECT_EQ(ThrownMessage([&] { stream.Create(missing); }), "Failed to create file: " + missing);
    EXPECT_EQ(ThrownMessage([&] { stream.OpenForWrite(missing); }), "Failed to open file: " + missing);

    // A file opened for writing cannot be read from.
    const std::string path = folder / "w.bin";
    stream.Create(path);
    uint8_t byte = 0;
    EXPECT_EQ(ThrownMessage([&] { stream.Read(&byte, 1); }), "Failed to read data from file.");
    EXPECT_EQ(ThrownMessage([&] { stream.ReadByte(); }), "Failed to read byte from file.");
}

TEST(FileStreamTest, AWriterExcludesOtherOpeners) {
    TempFolder folder;
    const std::string path = folder / "locked.bin";
    FileStream writer;
    writer.Create(path);
    FileStream reader;
    EXPECT_THROW(reader.Open(path), Exception);
    writer.Close();
    EXPECT_NO_THROW(reader.Open(path));
    FileStream second;
    EXPECT_NO_THROW(second.Open(path));  // readers share
}

TEST(MemoryStreamTest, SeekFollowsItsOriginsAndClampsToTheBuffer) {
    uint8_t data[20] = {};
    MemoryStream stream;
    EXPECT_EQ(stream.Seek(5, 0), 0);  // no buffer yet
    stream.Attach(data, 20);
    EXPECT_EQ(stream.Seek(5, 2), 15);
    EXPECT_EQ(stream.Seek(30, 2), 0);
    EXPECT_EQ(stream.Seek(30, 0), 20);
    EXPECT_EQ(stream.Seek(-5, 1), 15);
    EXPECT_EQ(stream.Seek(3, 7), 0);
    EXPECT_EQ(stream.GetPosition(), 15);
}

TEST(MemoryStreamTest, WritesAreCutToTheRoomLeftThenRefused) {
    uint8_t data[8] = {};
    MemoryStream stream;
    stream.Attach(data, 8);
    stream.Seek(4, 0);
    EXPECT_EQ(stream.Write("0123456789", 10), 4u);
    EXPECT_EQ(std::memcmp(data + 4, "0123", 4), 0);
    EXPECT_EQ(ThrownMessage([&] { stream.Write("x", 1); }), "Failed to write data to stream.");
    stream.Seek(0, 0);
    EXPECT_EQ(ThrownMessage([&] { stream.Write("x", 0); }), "Failed to write data to stream.");
    EXPECT_EQ(ThrownMessage([&] { stream.Write(nullptr, 1); }), "Failed to write data to stream.");
    stream.Seek(7, 0);
    stream.WriteByte('z');
    EXPECT_EQ(data[7], 'z');
    EXPECT_EQ(ThrownMessage([&] { stream.WriteByte('!'); }), "Failed to write data to stream.");
}

TEST(MemoryStreamTest, ANegativePositionRefusesReadsAndWrites) {
    uint8_t data[4] = {1, 2, 3, 4};
    MemoryStream stream;
    stream.Attach(data, 4);
    EXPECT_EQ(stream.Seek(-2, 0), -2);
    uint8_t out[4] = {};
    EXPECT_EQ(stream.ReadByte(), -1);
    EXPECT_EQ(stream.Read(out, 4), 0u);
    EXPECT_THROW(stream.Write("ab", 2), Exception);
    EXPECT_THROW(stream.WriteByte(9), Exception);
    EXPECT_EQ(data[0], 1);
}

TEST(MemoryStreamTest, CloseForgetsTheBufferWithoutFreeingIt) {
    uint8_t data[3] = {7, 8, 9};
    MemoryStream stream;
    stream.Attach(data, 3);
    EXPECT_EQ(stream.ReadByte(), 7);
    stream.Close();
    EXPECT_EQ(stream.GetLength(), 0);
    EXPECT_EQ(stream.ReadByte(), -1);
    stream.Attach(nullptr, 3);
    EXPECT_EQ(stream.GetLength(), 0);
    EXPECT_EQ(data[2], 9);
}

struct IntegerCase {
    std::vector<uint8_t> bytes;
    uint32_t value;
    const char* error;  // message prefix, or null for success
};

TEST(ReadBigEndian7BitEncodedIntTest, DecodesAndRejects) {
    const IntegerCase cases[] = {
        {{0x00}, 0, nullptr},
        {{0x7F}, 127, nullptr},
        {{0x81, 0x00}, 128, nullptr},
        {{0x8F, 0xFF, 0xFF, 0xFF, 0x7F}, 0xFFFFFFFFu, nullptr},
        // Five bytes whose value needs more than 32 bits: refused, not truncated.
        {{0x90, 0x80, 0x80, 0x80, 0x00}, 0, "ReadBigEndian7BitEncodedInt: Encoded integer does not fit in 32 bits."},
        {{0x80, 0x80, 0x80, 0x80, 0x80}, 0, "ReadBigEndian7BitEncodedInt: Invalid 7-bit encoded integer in stream."},
        {{0x81}, 0, "ReadBigEndian7BitEncodedInt: End of stream reached with bytes left to read."},
    };
    for (const IntegerCase& c : cases) {
        std::vector<uint8_t> bytes = c.bytes;
        MemoryStream stream;
        stream.Attach(bytes.data(), static_cast<int32_t>(bytes.size()));
        if (c.error == nullptr) {
            EXPECT_EQ(ReadBigEndian7BitEncodedInt(&stream), c.value);
        } else {
            const std::string expected = std::string(c.error) + " File:  Size: " + std::to_string(bytes.size());
            EXPECT_EQ(ThrownMessage([&] { ReadBigEndian7BitEncodedInt(&stream); }), expected);
        }
    }
}

TEST(CheckedReadTest, ReadsAcrossShortReadsAndNamesTheFileOnFailure) {
    TempFolder folder;
    const std::string path = folder / "seven.bin";
    WriteTextFile(path, "abcdefg");
    FileStream stream;
    stream.Open(path);
    uint8_t buffer[8] = {};
    CheckedReadBytes(&stream, buffer, 5);
    EXPECT_EQ(std::string(reinterpret_cast<char*>(buffer), 5), "abcde");
    EXPECT_EQ(CheckedReadByte(&stream), 'f');
    EXPECT_EQ(ThrownMessage([&] { CheckedReadBytes(&stream, buffer, 2); }),
              "CheckedReadBytes: End of stream reached with bytes left to read. File: seven.bin Size: 7");
    EXPECT_EQ(ThrownMessage([&] { CheckedReadByte(&stream); }),
              "CheckedReadByte: Expected to be able to read a byte. File: seven.bin Size: 7");
    EXPECT_NO_THROW(CheckedReadBytes(&stream, buffer, 0));
}

}  // namespace
