// What xdelta3 never writes, built by hand: application-defined code tables,
// target segments, every address mode, RUN and copies that overlap their
// own output.
#include <gtest/gtest.h>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/memory_stream.h"
#include "patch/checksum.h"
#include "patch/code_table.h"
#include "patch/vcdiff_decoder.h"
#include "tests/patch/delta_builder.h"
#include "tests/support/test_files.h"

namespace {

WindowLayout Adding(const std::string& text) {
    WindowLayout layout;
    layout.targetLength = static_cast<uint32_t>(text.size());
    layout.data = text;
    layout.instructions = AddOp(layout.targetLength);
    return layout;
}

uint32_t ChecksumOf(const std::string& text) {
    return Checksum(reinterpret_cast<const uint8_t*>(text.data()), static_cast<int64_t>(text.size()));
}

TEST(VcdiffHandBuilt, HeaderAloneAndSkippedApplicationDataGiveEmptyTargets) {
    for (const std::string& delta : {Header(), Header(0x04) + Varint(3) + "abc"}) {
        const DecodeResult result = DecodeInMemory("", delta);
        EXPECT_EQ(result.error, "");
        EXPECT_EQ(result.target, "");
    }
    // The skipped bytes really are skipped: a window follows them.
    EXPECT_EQ(DecodeInMemory("", Header(0x04) + Varint(3) + "abc" + Window(Adding("xyz"))).target, "xyz");
}

TEST(VcdiffHandBuilt, RunRepeatsOneDataByte) {
    WindowLayout layout;
    layout.targetLength = 7;
    layout.data = "abx";
    layout.instructions = AddOp(2) + RunOp(5);
    EXPECT_EQ(DecodeInMemory("", Header() + Window(layout)).target, "abxxxxx");
}

TEST(VcdiffHandBuilt, OverlappingCopiesRepeatTheirPeriod) {
    struct Case {
        std::string seed;
        uint32_t size;
    };
    for (const Case& c : {Case{"z", 10}, Case{"abc", 10}, Case{"abcdefg", 1000}, Case{"ab", 2}}) {
        WindowLayout layout;
        layout.targetLength = static_cast<uint32_t>(c.seed.size()) + c.size;
        layout.data = c.seed;
        layout.instructions = AddOp(static_cast<uint32_t>(c.seed.size())) + CopyOp(c.size, 1);
        layout.addresses = Varint(static_cast<uint32_t>(c.seed.size()));  // back to offset 0
        std::string expected = c.seed;
        for (uint32_t i = 0; i < c.size; ++i) expected += expected[i];
        EXPECT_EQ(DecodeInMemory("", Header() + Window(layout)).target, expected) << c.seed << " " << c.size;
    }
}

TEST(VcdiffHandBuilt, EveryAddressModeOfTheDefaultCache) {
    WindowLayout layout;
    layout.indicator = 0x01;
    layout.segmentLength = 16;
    layout.targetLength = 20;
    layout.instructions = CopyOp(4, 0) + CopyOp(4, 2) + CopyOp(4, 3) + CopyOp(4, 6) + CopyOp(4, 1);
    layout.addresses = Varint(2)      // self: 2
                       + Varint(4)    // near slot 0 (2) + 4 = 6
                       + Varint(0)    // near slot 1 (6) + 0 = 6
                       + "\x02"       // same block 0, byte 2: address 2
                       + Varint(20);  // here (16 + 16) - 20 = 12
    const DecodeResult result = DecodeInMemory("0123456789ABCDEF", Header() + Window(layout));
    EXPECT_EQ(result.error, "");
    EXPECT_EQ(result.target, "2345678967892345CDEF");
}

TEST(VcdiffHandBuilt, SourceSegmentStartsAtItsPosition) {
    WindowLayout layout;
    layout.indicator = 0x05;  // source and checksum
    layout.segmentLength = 4;
    layout.segmentPosition = 6;
    layout.targetLength = 4;
    layout.instructions = CopyOp(4, 0);
    layout.addresses = Varint(0);
    layout.checksum = ChecksumOf("6789");
    EXPECT_EQ(DecodeInMemory("0123456789", Header() + Window(layout)).target, "6789");
}

// A 3 GiB source without the disk space: the byte at p is p % 251.
class LargeSource : public FileStream {
public:
    int64_t Seek(int64_t offset, uint32_t) override { return position = offset; }
    int64_t GetLength() override { return int64_t{3} << 30; }
    uint32_t Read(void* destination, uint32_t count) override {
        for (uint32_t i = 0; i < count; ++i) static_cast<uint8_t*>(destination)[i] = (position + i) % 251;
        position += count;
        return count;
    }

private:
    int64_t position = 0;
};

TEST(VcdiffHandBuilt, SegmentPositionsAbove2GiBAreUnsigned) {
    const uint32_t at = 0x80000005u;
    WindowLayout layout;
    layout.indicator = 0x01;
    layout.segmentLength = 4;
    layout.segmentPosition = at;
    layout.targetLength = 4;
    layout.instructions = CopyOp(4, 0);
    layout.addresses = Varint(0);
    const std::string text = Header() + Window(layout);
    std::vector<uint8_t> bytes(text.begin(), text.end());
    std::vector<uint8_t> out(4);
    LargeSource source;
    MemoryStream delta;
    MemoryStream target;
    delta.Attach(bytes.data(), static_cast<int32_t>(bytes.size()));
    target.Attach(out.data(), 4);
    VcdiffDecoder::Decode(&source, &delta, &target);
    for (uint32_t i = 0; i < 4; ++i) EXPECT_EQ(out[i], (uint64_t{at} + i) % 251) << i;
}

TEST(VcdiffHandBuilt, TargetSegmentCopiesFromEarlierWindows) {
    WindowLayout again;
    again.indicator = 0x02;
    again.segmentLength = 5;
    again.segmentPosition = 6;
    again.targetLength = 6;
    again.data = "!";
    again.instructions = CopyOp(5, 0) + AddOp(1);
    again.addresses = Varint(0);
    const std::string delta = Header() + Window(Adding("hello world")) + Window(again) + Window(Adding("."));
    const DecodeResult result = DecodeInMemory("", delta);
    EXPECT_EQ(result.error, "");
    EXPECT_EQ(result.target, "hello worldworld!.");

    // A target file open only for writing cannot give the segment back.
    TempFolder folder;
    FileStream source;
    FileStream deltaFile;
    FileStream target;
    WriteTextFile(folder / "source", "");
    WriteTextFile(folder / "delta", delta);
    source.Open(folder / "source");
    deltaFile.Open(folder / "delta");
    target.Create(folder / "target");
    try {
        VcdiffDecoder::Decode(&source, &deltaFile, &target);
        FAIL() << "a target segment read from a write-only file";
    } catch (const Exception& error) {
        EXPECT_EQ(error.message, "Failed to read data from file.");
    }
}

TEST(VcdiffHandBuilt, ApplicationDefinedCodeTableAndCacheSizes) {
    // Near cache 1, same cache 1: modes 0 self, 1 here, 2 near, 3 same.
    CodeTable::Encoded table = CodeTable::Default().Encode();
    auto set = [&table](int index, int row, uint8_t value) { table[row * 256 + index] = value; };
    set(0, 0, kAdd), set(0, 2, 3);                 // entry 0: ADD 3,
    set(0, 1, kCopy), set(0, 3, 3), set(0, 5, 1);  //          COPY 3 in mode here
    set(1, 0, kCopy), set(1, 2, 0), set(1, 4, 3);  // entry 1: COPY (size follows) in mode same
    set(2, 0, kNoop), set(2, 2, 0), set(2, 4, 0);  // entry 2: nothing at all
    WindowLayout layout;
    layout.targetLength = 8;
    layout.data = "abc";
    layout.instructions = std::string("\x00\x02\x01", 3) + Varint(2);
    layout.addresses = Varint(3) + std::string(1, '\0');
    const std::string header = Header(0x02) + CodeTableSection(std::string(table.begin(), table.end()), 1, 1);
    const DecodeResult result = DecodeInMemory("", header + Window(layout));
    EXPECT_EQ(result.error, "");
    EXPECT_EQ(result.target, "abcabcab");
}

TEST(VcdiffHandBuilt, WindowWithBadChecksumIsWrittenThenRejected) {
    WindowLayout good = Adding("abc");
    good.indicator = 0x04;
    good.checksum = ChecksumOf("abc");
    WindowLayout bad = Adding("def");
    bad.indicator = 0x04;
    bad.checksum = ChecksumOf("abc");
    const DecodeResult result = DecodeInMemory("", Header() + Window(good) + Window(bad) + Window(Adding("ghi")));
    EXPECT_EQ(result.error, "Invalid Checksum after decoding window");
    EXPECT_EQ(result.code, 0);
    EXPECT_EQ(result.target, "abcdef");
}

TEST(VcdiffHandBuilt, SourceSegmentWithoutSourceStreamIsRefused) {
    WindowLayout layout;
    layout.indicator = 0x01;
    const std::string text = Header() + Window(layout);
    std::vector<uint8_t> bytes(text.begin(), text.end());
    MemoryStream delta;
    MemoryStream target;
    delta.Attach(bytes.data(), static_cast<int32_t>(bytes.size()));
    VcdiffDecoder decoder(nullptr, &delta, &target);
    decoder.ReadHeader();
    try {
        decoder.DecodeWindow();
        FAIL() << "decoded without a source";
    } catch (const Exception& error) {
        EXPECT_EQ(error.message, "Source stream requested by delta but not provided by caller.");
    }
}

}  // namespace
