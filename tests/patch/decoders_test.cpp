// DecodeLzma on every shape of stream the header allows (SDK encoder, xz), broken or hostile; PatchArchive's member
// search; VcdiffDecoder on xdelta3's deltas, on hand-made ones for what xdelta3 never writes, and on every damage.
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <vector>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/memory_stream.h"
#include "base/paths.h"
#include "patch/checksum.h"
#include "patch/code_table.h"
#include "patch/lzma_decoder.h"
#include "patch/patch_archive.h"
#include "patch/vcdiff_decoder.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

CancellationToken quit;

// A memory stream over its own bytes, with room for at least capacity. Its failingRead-th read throws, as a file does
// that cannot be read (negative: the player asks to quit at that read), and it takes writes of nothing.
struct Bytes : MemoryStream {
    explicit Bytes(const std::string& text, size_t capacity = 0) : bytes(text) {
        bytes.resize(std::max(text.size(), capacity));
        Attach(reinterpret_cast<uint8_t*>(&bytes[0]), static_cast<int32_t>(bytes.size()));
    }
    uint32_t Read(void* destination, uint32_t count) override {
        if (++reads == failingRead) throw Exception("Failed to read data from file.");
        if (reads == -failingRead) quit.Cancel();
        return MemoryStream::Read(destination, count);
    }
    uint32_t Write(const void* source, uint32_t count) override {
        return count == 0 ? 0 : MemoryStream::Write(source, count);
    }
    std::string Written() { return bytes.substr(0, static_cast<size_t>(GetPosition())); }
    std::string bytes;
    int failingRead = 0;
    int reads = 0;
};

// The decoded data, or the error and its code.
std::string Decode(const std::string& lzma, int failingRead = 0) {
    Bytes input(lzma), output("", 1 << 18);
    input.failingRead = failingRead;
    const std::string error = ErrorOf([&] { DecodeLzma(input, output, &quit); });
    quit.Reset();
    return error.empty() ? output.Written() : error;
}

// Writes value over bytes bytes of the stream, lowest first.
std::string Patched(std::string lzma, size_t at, uint64_t value, int bytes = 1) {
    for (int i = 0; i < bytes; ++i) lzma[at + i] = static_cast<char>(value >> (8 * i));
    return lzma;
}

TEST(DecodeLzma, DecodesEveryShapeAndRefusesBrokenStreams) {
    const std::string dataError = "Data error, please verify that downloaded files are complete and correct! (0)";
    const std::string allocationFailure = "Failed to allocate LZMA structures while decoding. (0)";
    // level, dictionary size, lc, lp, pb, size stored, end marker
    const LzmaOptions marked = {5, 0, 3, 0, 2, false};
    std::string text;  // as data/make_lzma_fixtures.sh writes it
    for (int i = 0; i < 3000; ++i) {
        text += "line " + std::to_string(i) + " of the fixture, value " + std::to_string(i * 7919 % 10007) + "\n";
    }
    const std::string buffer = text.substr(0, 65536);
    const std::string sized = EncodeLzma(text);
    const std::string markedText = EncodeLzma(text, marked);
    const std::string sizeAndMarker = EncodeLzma(text, {5, 0, 3, 0, 2, true, true});
    const std::string noise = SeededBytes(200000, 1);  // a stream of several reads
    const struct {
        const char* name;
        std::string lzma;
        std::string expected;
        int failingRead = 0;
    } cases[] = {
        {"empty, size stored", EncodeLzma(""), ""},
        {"empty, end marker", EncodeLzma("", marked), ""},
        {"exactly one buffer", EncodeLzma(buffer), buffer},
        {"exactly one buffer, end marker", EncodeLzma(buffer, marked), buffer},
        {"one buffer and one", EncodeLzma(text.substr(0, 65537)), text.substr(0, 65537)},
        {"size stored", sized, text},
        {"end marker", markedText, text},
        {"size and end marker", sizeAndMarker, text},
        {"lc8 lp4 pb4", EncodeLzma(text, {5, 0, 8, 4, 4, false}), text},
        {"data far larger than the dictionary", EncodeLzma(text, {5, 4096}), text},
        {"huge dictionary bounded by the stated size", Patched(sized, 1, 0xFFFFFFFFu, 4), text},
        {"xz", ReadTextFile(IRONVALE_SOURCE_DIR "/tests/patch/data/text.xz.lzma"), text},
        {"xz, empty", ReadTextFile(IRONVALE_SOURCE_DIR "/tests/patch/data/empty.xz.lzma"), ""},
        {"sized stream cut short", sized.substr(0, sized.size() / 2), dataError},
        {"marked stream cut short", markedText.substr(0, markedText.size() - 8), dataError},
        {"end marker before the stated size", Patched(sizeAndMarker, 5, text.size() + 1, 4), dataError},
        {"range coder not starting with zero", Patched(sized, 13, 1), dataError},
        {"header cut short", sized.substr(0, 12),
         "Missing data, please verify that downloaded files are complete! (0)"},
        {"lc/lp/pb byte out of range", Patched(sized, 0, 225), allocationFailure},
        {"dictionary over the limit, size unknown", Patched(markedText, 1, kMaximumLzmaDictionarySize + 1, 4),
         allocationFailure},
        // Passed on unchanged, and (under the leak checker) after freeing the decoder state.
        {"stream error in the loop", EncodeLzma(noise), "Failed to read data from file. (0)", 3},
        // A stopped extraction must never pass for a finished, shorter one.
        {"quit request: a cancel, which says nothing", EncodeLzma(noise), " (1)", -3},
    };
    for (const auto& c : cases) {
        const std::string decoded = Decode(c.lzma, c.failingRead);
        EXPECT_TRUE(decoded == c.expected) << c.name << ": " << decoded.substr(0, 80);
    }
}

// A member header claiming size bytes of data, and the data.
std::string Member(const std::string& name, const std::string& data, uint64_t size) {
    return Patched(static_cast<char>(name.size()) + name + "12345", name.size() + 1, size, 5) + data;
}
std::string Member(const std::string& name, const std::string& data) { return Member(name, data, data.size()); }

// The member's text, or the error.
std::string Extract(const std::string& archiveBytes, const std::string& member) {
    TempFolder folder;
    WriteTextFile(folder / "a.pak", archiveBytes);
    const std::string error = ErrorOf([&] { PatchArchive(folder / "a.pak").DecodeFile(member, folder / "out"); });
    return error.empty() ? ReadTextFile(folder / "out") : error;
}

TEST(PatchArchive, FindsMembersByExactName) {
    // End markers instead of stated sizes: the decoder reads whole blocks and must stop at the marker, whatever follows
    // in the file.
    const LzmaOptions marked = {5, 0, 3, 0, 2, false};
    const std::string archive = Member("data\\one.txt", EncodeLzma("first", marked)) +
                                Member("data\\two.txt", EncodeLzma("second", marked)) +
                                Member("data\\one.txt", EncodeLzma("shadowed", marked)) + Member("empty.txt", "");
    const struct {
        std::string bytes;
        std::string member;
        std::string found = "";  // none: not found
    } cases[] = {
        {archive, "data\\one.txt", "first"},
        {archive, "data\\two.txt", "second"},
        {archive, "DATA\\ONE.TXT"},
        {archive, "data\\one"},
        {archive, "empty.txt"},                               // a name with no data
        {std::string(5, '\0'), ""},                           // five bytes hold no member
        {archive + "\xFFshort", "data\\two.txt", "second"},   // a broken tail after the member
        {archive + "\xFFshort", "short"},                     // a name running past the end
        {Member("wanted", EncodeLzma("x"), 1000), "wanted"},  // a member larger than the file
        // Sizes have 40 bits: cut to 32, this one would end where "x" starts.
        {Member("huge", "", 1ull << 32) + Member("x", EncodeLzma("x")), "x"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Extract(c.bytes, c.member),
                  c.found.empty() ? "Failed to find file in patch archive. File: " + c.member + " (0)" : c.found);
    }
}

// Magic, version 0 and the header indicator.
std::string Header(uint8_t indicator = 0) { return std::string("\xD6\xC3\xC4\x00", 4) + static_cast<char>(indicator); }

// Instructions of the default code table, each with its size written out.
std::string AddOp(uint32_t size) { return "\x01" + Varint(size); }
std::string RunOp(uint32_t size) { return std::string(1, '\0') + Varint(size); }
std::string CopyOp(uint32_t size, uint8_t mode) { return static_cast<char>(19 + 16 * mode) + Varint(size); }

uint32_t ChecksumOf(const std::string& text) {
    return Checksum(reinterpret_cast<const uint8_t*>(text.data()), static_cast<int64_t>(text.size()));
}

// The checksum is written when the indicator has bit 2; lengthError is added to the true length of the delta encoding.
std::string Window(uint8_t indicator, uint32_t segmentLength, uint32_t segmentPosition, uint32_t targetLength,
                   const std::string& data, const std::string& instructions, const std::string& addresses = "",
                   uint32_t checksum = 0, int32_t lengthError = 0, char deltaIndicator = 0) {
    std::string body = Varint(targetLength) + deltaIndicator + Varint(data.size()) + Varint(instructions.size()) +
                       Varint(addresses.size());
    for (int shift = 24; shift >= 0 && (indicator & 0x04); shift -= 8) body += static_cast<char>(checksum >> shift);
    std::string window(1, static_cast<char>(indicator));
    if (indicator & 0x03) window += Varint(segmentLength) + Varint(segmentPosition);
    return window + Varint(body.size() + data.size() + instructions.size() + addresses.size() + lengthError) + body +
           data + instructions + addresses;
}

std::string Adding(const std::string& text) { return Window(0, 0, 0, text.size(), text, AddOp(text.size())); }

// A header bringing its own code table: the default one with its first entries replaced, cut to length bytes. Entries
// 0-2 of each of the six rows are sent, the rest is copied from the default table.
std::string OwnTable(uint8_t nearSize, uint8_t sameSize, const std::vector<CodeTableEntry>& entries,
                     size_t length = CodeTable::kEncodedSize) {
    CodeTable::Encoded table = CodeTable::Default().Encode();
    for (size_t i = 0; i < entries.size(); ++i) {
        const auto& [a, b] = entries[i];
        const uint32_t rows[6] = {a.type, b.type, a.size, b.size, a.mode, b.mode};
        for (int row = 0; row < 6; ++row) table[row * 256 + i] = static_cast<uint8_t>(rows[row]);
    }
    std::string data, instructions, addresses;
    for (size_t row = 0; row < length; row += 256) {
        data.append(reinterpret_cast<const char*>(&table[row]), 3);
        instructions += AddOp(3) + CopyOp(std::min<size_t>(253, length - row - 3), 0);
        addresses += Varint(row + 3);
    }
    const std::string compressed =
        Header() + Window(1, CodeTable::kEncodedSize, 0, length, data, instructions, addresses);
    return Header(0x02) + Varint(compressed.size() + 2) + static_cast<char>(nearSize) + static_cast<char>(sameSize) +
           compressed;
}

// Runs the decoder's own steps, so that a missing source reaches it: what reached the target, and the error text (empty
// on success).
std::pair<std::string, std::string> DecodeDelta(FileStream* source, const std::string& delta,
                                                size_t capacity = 1 << 16) {
    Bytes deltaStream(delta), target("", capacity);
    const std::string error = ErrorOf([&] {
        VcdiffDecoder decoder(source, &deltaStream, &target);
        decoder.ReadHeader();
        while (decoder.DecodeWindow()) {
        }
    });
    return {target.Written(), error};
}

template <typename... Args>
std::string Delta(Args... window) {
    return Header() + Window(window...);
}

const std::string kTargetSegment =
    Header() + Adding("hello world") + Window(2, 5, 6, 6, "!", CopyOp(5, 0) + AddOp(1), Varint(0)) + Adding(".");

TEST(VcdiffDecoder, RebuildsXdelta3Output) {
    const auto path = [](const std::string& name) { return PathJoin(VCDIFF_CASES_DIR, name); };
    std::ifstream manifest(path("manifest.txt"));
    int cases = 0;
    for (std::string source, delta, target; manifest >> source >> delta >> target; ++cases) {
        FileStream sourceFile;
        sourceFile.Open(path(source));
        const std::string expected = ReadTextFile(path(target));
        const auto [decoded, error] = DecodeDelta(&sourceFile, ReadTextFile(path(delta)), expected.size());
        EXPECT_TRUE(error.empty() && decoded == expected) << delta << ": " << error;
    }
    EXPECT_EQ(cases, 12) << "interop cases missing from " << VCDIFF_CASES_DIR;

    // The applier creates targets write-only: a target segment is an error.
    TempFolder folder;
    WriteTextFile(folder / "delta", kTargetSegment);
    FileStream source, delta, target;
    source.Open(path("empty.source"));
    delta.Open(folder / "delta");
    target.Create(folder / "out");
    EXPECT_THROW(VcdiffDecoder::Decode(&source, &delta, &target), Exception);
}

// A 3 GiB source without the disk space: the byte at p is p % 251.
struct LargeSource : FileStream {
    int64_t Seek(int64_t offset, uint32_t) override { return position = offset; }
    int64_t GetLength() override { return int64_t{3} << 30; }
    uint32_t Read(void* destination, uint32_t count) override {
        for (uint32_t i = 0; i < count; ++i) static_cast<uint8_t*>(destination)[i] = (position + i) % 251;
        position += count;
        return count;
    }
    int64_t position = 0;
};

// Each row decodes a delta against a 16-byte source: a part of the error text (none for a delta that is fine) and what
// reaches the target.
TEST(VcdiffDecoder, DecodesWhatXdelta3NeverWritesAndRefusesEveryDamage) {
    const uint32_t kSegment = VcdiffDecoder::kMaxSegmentLength;
    const uint32_t kWindow = VcdiffDecoder::kMaxTargetWindowLength;
    const uint32_t kEncoding = VcdiffDecoder::kMaxDeltaEncodingLength;
    const struct {
        std::string delta;
        std::string error;
        std::string target = "";
        size_t capacity = 1 << 16;
    } rows[] = {
        {Header(), ""},
        {Header(0x04) + Varint(3) + "abc" + Adding("xyz"), "", "xyz"},  // application data is skipped
        {Delta(0, 0, 0, 7, "abx", AddOp(2) + RunOp(5)), "", "abxxxxx"},
        // Copies that overlap what they produce: the period repeats.
        {Delta(0, 0, 0, 11, "z", AddOp(1) + CopyOp(10, 1), Varint(1)), "", "zzzzzzzzzzz"},
        {Delta(0, 0, 0, 13, "abc", AddOp(3) + CopyOp(10, 1), Varint(3)), "", "abcabcabcabca"},
        {Delta(0, 0, 0, 4, "ab", AddOp(2) + CopyOp(2, 1), Varint(2)), "", "abab"},
        // Every address mode of the default cache: self 2; near slot 0 (2) + 4; near slot 1 (6) + 0; same block 0, byte
        // 2; here 32 - 20.
        {Delta(1, 16, 0, 20, "", CopyOp(4, 0) + CopyOp(4, 2) + CopyOp(4, 3) + CopyOp(4, 6) + CopyOp(4, 1),
               Varint(2) + Varint(4) + Varint(0) + "\x02" + Varint(20)),
         "", "2345678967892345CDEF"},
        {kTargetSegment, "", "hello worldworld!."},
        // Near and same cache of one slot each: modes 0 self, 1 here, 2 near, 3 same. Entry 0 adds 3 and copies 3 from
        // here, entry 1 copies in mode same, entry 2 does nothing.
        {OwnTable(1, 1, {{{kAdd, 3, 0}, {kCopy, 3, 1}}, {{kCopy, 0, 3}, {}}, {}}) +
             Window(0, 0, 0, 8, "abc", std::string("\x00\x02\x01", 3) + Varint(2), Varint(3) + '\0'),
         "", "abcabcab"},

        {std::string("\xD6\xC3\xC5\x00\x00", 5), "Invalid VCDIFF header"},
        {std::string("\xD6\xC3\xC4\x01\x00", 5), "can only read delta streams of version 0"},
        {Header(0xF9), "does not handle delta stream using secondary compressors"},
        {Header(0x08), "Invalid header indicator - bits 3-7 not all zero."},
        {"\xD6\xC3", "CheckedReadBytes: End of stream reached"},
        {Header(0x02) + Varint(1), "Code table length 1 leaves no room for the cache sizes."},
        {Header(0x02) + Varint(100) + "\x04\x03", "code table of 98 bytes is longer than the 0 bytes left"},
        {OwnTable(4, 3, {}, 1535), "Compressed code table was incorrect size"},
        {Header(0x02) + Varint(10) + "\x04\x03" + Header(0x02) + Varint(3) + "\x04\x03", "may not bring a code table"},
        {Header() + "\x03", "Invalid window indicator - bits 0 and 1 both set."},
        {Header() + "\x0C", "Invalid window indicator - bits 3-7 not all zero."},
        {Delta(0, 0, 0, 3, "abc", AddOp(3), "", 0, 0, 1), "unable to handle compressed delta sections."},
        {Delta(1, kSegment + 1, 0, 3, "abc", AddOp(3)), "exceeds the limit of " + std::to_string(kSegment)},
        {Delta(1, 1, 0xFFFFFFFF, 3, "abc", AddOp(3)), "of 1 bytes at 4294967295 runs past the end of the source (16"},
        {Delta(2, 1, 0, 3, "abc", AddOp(3)), "Target segment of 1 bytes at 0 runs past the 0 bytes written"},
        {Delta(0, 0, 0, kWindow + 1, "abc", AddOp(3)), "exceeds the limit of " + std::to_string(kWindow)},
        {Delta(0, 0, 0, 3, "abc", AddOp(3), "", 0, kEncoding), "exceeds the limit of " + std::to_string(kEncoding)},
        {Delta(0, 0, 0, 3, "abc", AddOp(3), "", 0, 1), "encoding of 11 bytes is longer than the 10 bytes left"},
        {Delta(0, 0, 0, 3, "abc", AddOp(3), "", 0, -1), "add up to 10 bytes, but the delta encoding length is 9"},
        {Delta(0, 0, 0, 3, "ab", AddOp(3)), "ADD of 3 bytes runs past the end of the data section."},
        {Delta(0, 0, 0, 3, "", RunOp(3)), "RUN runs past the end of the data section."},
        {Delta(0, 0, 0, 2, "abc", AddOp(3)), "Instruction size 3 overflows the target window (2 bytes left)."},
        {Delta(1, 4, 0, 3, "", CopyOp(3, 0), Varint(2)), "COPY of 3 bytes at 2 runs past the end of the segment"},
        {Delta(0, 0, 0, 3, "a", AddOp(1) + CopyOp(2, 2), Varint(1)), "address 1 is at or after the current position 1"},
        {Delta(0, 0, 0, 3, "a", AddOp(1) + CopyOp(2, 1), Varint(2)), "lies 2 bytes back from position 1, before"},
        {OwnTable(4, 3, {{{kCopy, 1, 9}, {}}}) + Window(0, 0, 0, 3, "a", AddOp(1) + '\0' + AddOp(1)),
         "COPY address mode 9 is past the 4 near and 3 same cache slots."},
        {OwnTable(4, 3, {{{4, 1, 0}, {}}}) + Window(0, 0, 0, 3, "", std::string(1, '\0')), "Invalid instruction type"},
        {Delta(0, 0, 0, 3, "", CopyOp(3, 0)), "ReadBigEndian7BitEncodedInt: End of stream reached"},
        {Delta(0, 0, 0, 5, "abc", AddOp(3)), "Instructions produced 3 of the 5 bytes of the target window."},
        {Delta(0, 0, 0, 3, "abcd", AddOp(3)), "1 bytes of the data section were not used."},
        {Delta(0, 0, 0, 3, "abc", AddOp(3), Varint(0)), "1 bytes of the addresses section were not used."},
        {Delta(4, 0, 0, 3, "abc", AddOp(3), "", 1), "Invalid Checksum after decoding window", "abc"},
        {Header() + Adding("abc"), "The target took only 2 of the 3 bytes of the window.", "ab", 2},
    };
    for (const auto& row : rows) {
        Bytes source("0123456789ABCDEF");
        const auto [target, error] = DecodeDelta(&source, row.delta, row.capacity);
        EXPECT_EQ(target, row.target) << row.target << row.error;
        EXPECT_TRUE(row.error.empty() ? error.empty() : error.find(row.error) != std::string::npos)
            << row.target << row.error << ": " << error;
    }
    EXPECT_EQ(DecodeDelta(nullptr, Delta(1, 0, 0, 3, "abc", AddOp(3))).second,
              "Source stream requested by delta but not provided by caller. (0)");
    LargeSource large;
    const uint32_t at = 0x800000A1;  // above 2 GiB; at % 251 is 'a'
    const auto [target, error] =
        DecodeDelta(&large, Delta(5, 4, at, 4, "", CopyOp(4, 0), Varint(0), ChecksumOf("abcd")));
    EXPECT_EQ(error + target, "abcd");
}

TEST(VcdiffDecoder, DefaultCodeTableAndChecksum) {
    // Entries of two instructions, which xdelta3 never writes: the first and last of every group (index, types, sizes
    // and modes of the two halves).
    const uint8_t entries[][7] = {
        {163, kAdd, kCopy, 1, 4, 0, 0}, {165, kAdd, kCopy, 1, 6, 0, 0}, {166, kAdd, kCopy, 2, 4, 0, 0},
        {234, kAdd, kCopy, 4, 6, 0, 5}, {235, kAdd, kCopy, 1, 4, 0, 6}, {246, kAdd, kCopy, 4, 4, 0, 8},
        {247, kCopy, kAdd, 4, 1, 0, 0}, {255, kCopy, kAdd, 4, 1, 8, 0},
    };
    const CodeTable::Encoded table = CodeTable::Default().Encode();
    for (const auto& entry : entries) {
        for (int row = 0; row < 6; ++row) EXPECT_EQ(table[row * 256 + entry[0]], entry[1 + row]) << int{entry[0]};
    }
    EXPECT_EQ(ChecksumOf("abc"), 0x024D0127u);
    // Long runs of 0xFF bring the sums nearest to overflow between reductions.
    uint32_t a = 1, b = 0;
    for (int i = 0; i < 100000; ++i) a = (a + 0xFF) % 65521, b = (b + a) % 65521;
    EXPECT_EQ(ChecksumOf(std::string(100000, '\xFF')), b << 16 | a);
    EXPECT_THROW(Checksum(nullptr, 3), Exception);
}

}  // namespace
