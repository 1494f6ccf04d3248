// Every damaged or hostile delta the decoder must refuse, one row each, with
// the text it gives and what reached the target before the refusal.
#include <gtest/gtest.h>

#include <functional>

#include "patch/code_table.h"
#include "patch/vcdiff_decoder.h"
#include "tests/patch/delta_builder.h"

namespace {

const std::string kSource = "0123456789";

// A window that adds "abc", changed as a row needs.
std::string WindowOnly(const std::function<void(WindowLayout&)>& change) {
    WindowLayout layout;
    layout.targetLength = 3;
    layout.data = "abc";
    layout.instructions = AddOp(3);
    change(layout);
    return Window(layout);
}

std::string OneWindow(const std::function<void(WindowLayout&)>& change) { return Header() + WindowOnly(change); }

// A header with the default table except entry 0 (first instruction only).
std::string TableWithEntry0(uint8_t type, uint8_t size, uint8_t mode, size_t length = CodeTable::kEncodedSize) {
    CodeTable::Encoded table = CodeTable::Default().Encode();
    table[0] = type;
    table[2 * 256] = size;
    table[4 * 256] = mode;
    return Header(0x02) + CodeTableSection(std::string(table.begin(), table.begin() + length), 4, 3);
}

struct Row {
    const char* name;
    std::string delta;
    std::string error;
    std::string written = "";
    size_t capacity = 1 << 16;
};

std::vector<Row> Rows() {
    const std::string window = "VcdiffDecoder->DecodeWindow: ";
    const auto limit = [](uint32_t value) { return std::to_string(value); };
    return {
        {"bad magic", std::string("\xD6\xC3\xC5\x00\x00", 5),
         "VcdiffDecoder->ReadHeader: Invalid VCDIFF header in delta stream"},
        {"version 1", std::string("\xD6\xC3\xC4\x01\x00", 5),
         "VcdiffDecoder->ReadHeader: VcdiffDecoder can only read delta streams of version 0"},
        {"secondary compressor, bits 3-7 set too", Header(0xF9),
         "VcdiffDecoder->ReadHeader: VcdiffDecoder does not handle delta stream using secondary compressors"},
        {"header bits 3-7", Header(0x08),
         "VcdiffDecoder->ReadHeader: Invalid header indicator - bits 3-7 not all zero."},
        {"truncated magic", "\xD6\xC3",
         "CheckedReadBytes: End of stream reached with bytes left to read. File:  Size: 2"},
        {"code table length 1", Header(0x02) + Varint(1),
         "VcdiffDecoder->ReadCodeTable: Code table length 1 leaves no room for the cache sizes."},
        {"code table longer than the delta", Header(0x02) + Varint(100) + "\x04\x03",
         "VcdiffDecoder: Compressed code table of 98 bytes is longer than the 0 bytes left in the delta."},
        {"code table of 1535 bytes", TableWithEntry0(kRun, 0, 0, 1535),
         "VcdiffDecoder->ReadCodeTable: Compressed code table was incorrect size"},
        {"code table inside a code table",
         Header(0x02) + Varint(10) + "\x04\x03" + Header(0x02) + Varint(3) + "\x04\x03",
         "VcdiffDecoder->ReadCodeTable: A compressed code table may not bring a code table of its own."},
        {"window bits 0 and 1", Header() + "\x03", "Invalid window indicator - bits 0 and 1 both set."},
        {"window bits 3-7", Header() + "\x0C", "Invalid window indicator - bits 3-7 not all zero."},
        {"truncated window", Header() + std::string(1, '\0'),
         "ReadBigEndian7BitEncodedInt: End of stream reached with bytes left to read. File:  Size: 6"},
        {"compressed sections", OneWindow([](WindowLayout& s) { s.deltaIndicator = 1; }),
         "VcdiffDecoder is unable to handle compressed delta sections."},
        {"segment over the limit",
         OneWindow([](WindowLayout& s) { s.indicator = 1, s.segmentLength = VcdiffDecoder::kMaxSegmentLength + 1; }),
         window + "Segment length " + limit(VcdiffDecoder::kMaxSegmentLength + 1) + " exceeds the limit of " +
             limit(VcdiffDecoder::kMaxSegmentLength) + " bytes."},
        {"source segment past the source",
         OneWindow([](WindowLayout& s) { s.indicator = 1, s.segmentLength = 5, s.segmentPosition = 6; }),
         window + "Source segment of 5 bytes at 6 runs past the end of the source (10 bytes)."},
        {"source segment at a position above 2 GiB",
         OneWindow([](WindowLayout& s) { s.indicator = 1, s.segmentLength = 1, s.segmentPosition = 0xFFFFFFFF; }),
         window + "Source segment of 1 bytes at 4294967295 runs past the end of the source (10 bytes)."},
        {"target segment past the bytes written",
         OneWindow([](WindowLayout& s) { s.indicator = 2, s.segmentLength = 1; }),
         window + "Target segment of 1 bytes at 0 runs past the 0 bytes written so far."},
        {"target window over the limit",
         OneWindow([](WindowLayout& s) { s.targetLength = VcdiffDecoder::kMaxTargetWindowLength + 1; }),
         window + "Target window length " + limit(VcdiffDecoder::kMaxTargetWindowLength + 1) +
             " exceeds the limit of " + limit(VcdiffDecoder::kMaxTargetWindowLength) + " bytes."},
        {"delta encoding over the limit",
         OneWindow([](WindowLayout& s) { s.encodingLengthError = VcdiffDecoder::kMaxDeltaEncodingLength; }),
         window + "Delta encoding length " + limit(VcdiffDecoder::kMaxDeltaEncodingLength + 10) +
             " exceeds the limit of " + limit(VcdiffDecoder::kMaxDeltaEncodingLength) + " bytes."},
        {"delta encoding longer than the delta", OneWindow([](WindowLayout& s) { s.encodingLengthError = 1; }),
         "VcdiffDecoder: Delta encoding of 11 bytes is longer than the 10 bytes left in the delta."},
        {"sections that do not add up", OneWindow([](WindowLayout& s) { s.encodingLengthError = -1; }),
         window + "Section lengths add up to 10 bytes, but the delta encoding length is 9."},
        {"ADD past the data section", OneWindow([](WindowLayout& s) { s.data = "ab"; }),
         window + "ADD of 3 bytes runs past the end of the data section."},
        {"RUN past the data section", OneWindow([](WindowLayout& s) { s.data = "", s.instructions = RunOp(3); }),
         window + "RUN runs past the end of the data section."},
        {"instruction size over the window", OneWindow([](WindowLayout& s) { s.targetLength = 2; }),
         window + "Instruction size 3 overflows the target window (2 bytes left)."},
        {"COPY past the segment", OneWindow([](WindowLayout& s) {
             s.indicator = 1, s.segmentLength = 4, s.data = "", s.instructions = CopyOp(3, 0), s.addresses = Varint(2);
         }),
         window + "COPY of 3 bytes at 2 runs past the end of the segment (4 bytes)."},
        {"COPY at the current position", OneWindow([](WindowLayout& s) {
             s.data = "a", s.instructions = AddOp(1) + CopyOp(2, 0), s.addresses = Varint(1);
         }),
         "VcdiffDecoder: COPY address 1 is at or after the current position 1."},
        {"COPY from a near slot past the position", OneWindow([](WindowLayout& s) {
             s.data = "a", s.instructions = AddOp(1) + CopyOp(2, 2), s.addresses = Varint(0xFFFFFFFF);
         }),
         "VcdiffDecoder: COPY address 4294967295 is at or after the current position 1."},
        {"COPY before the start", OneWindow([](WindowLayout& s) {
             s.data = "a", s.instructions = AddOp(1) + CopyOp(2, 1), s.addresses = Varint(2);
         }),
         "VcdiffDecoder: COPY address lies 2 bytes back from position 1, before the start of the segment."},
        {"same-cache mode past the slots", TableWithEntry0(kCopy, 1, 9) + WindowOnly([](WindowLayout& s) {
                                               s.data = "a", s.instructions = AddOp(1) + '\0' + AddOp(1);
                                           }),
         "VcdiffDecoder: COPY address mode 9 is past the 4 near and 3 same cache slots."},
        {"instruction type 4", TableWithEntry0(4, 1, 0) + WindowOnly([](WindowLayout& s) { s.instructions = '\0'; }),
         "Invalid instruction type found."},
        {"missing instruction size", OneWindow([](WindowLayout& s) { s.instructions = "\x01"; }),
         "ReadBigEndian7BitEncodedInt: End of stream reached with bytes left to read. File:  Size: 1"},
        {"missing address", OneWindow([](WindowLayout& s) { s.data = "", s.instructions = CopyOp(1, 0); }),
         "ReadBigEndian7BitEncodedInt: End of stream reached with bytes left to read. File:  Size: 0"},
        {"window not filled", OneWindow([](WindowLayout& s) { s.targetLength = 5; }),
         window + "Instructions produced 3 of the 5 bytes of the target window."},
        {"data left over", OneWindow([](WindowLayout& s) { s.data = "abcd"; }),
         window + "1 bytes of the data section were not used."},
        {"addresses left over", OneWindow([](WindowLayout& s) { s.addresses = Varint(0); }),
         window + "1 bytes of the addresses section were not used."},
        {"bad checksum", OneWindow([](WindowLayout& s) { s.indicator = 4, s.checksum = 1; }),
         "Invalid Checksum after decoding window", "abc"},
        {"target without room", OneWindow([](WindowLayout&) {}),
         window + "The target took only 2 of the 3 bytes of the window.", "ab", 2},
    };
}

TEST(VcdiffRejection, EveryRowFailsWithItsText) {
    for (const Row& row : Rows()) {
        const DecodeResult result = DecodeInMemory(kSource, row.delta, row.capacity);
        EXPECT_EQ(result.error, row.error) << row.name;
        EXPECT_EQ(result.code, 0) << row.name;
        EXPECT_EQ(result.target, row.written) << row.name;
    }
}

}  // namespace
