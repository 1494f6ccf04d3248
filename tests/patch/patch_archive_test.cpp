// DecodeLzma on streams of the SDK encoder in every shape the stand-alone
// header allows, of xz (data/make_lzma_fixtures.sh), and on broken or
// hostile ones; how PatchArchive finds its members.
#include "patch/patch_archive.h"

#include <gtest/gtest.h>

#include <string>

#include "base/exception.h"
#include "base/memory_stream.h"
#include "patch/lzma_decoder.h"
#include "tests/support/test_files.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

// Reads the bytes attached (its failingRead-th read throws, as a file does
// that cannot be read) and, unlike a memory stream, takes writes of nothing.
struct Stream : MemoryStream {
    uint32_t Read(void* destination, uint32_t count) override {
        if (++reads == failingRead) throw Exception("Failed to read data from file.");
        return MemoryStream::Read(destination, count);
    }
    uint32_t Write(const void* source, uint32_t count) override {
        written.append(static_cast<const char*>(source), count);
        return count;
    }
    int failingRead = 0;
    int reads = 0;
    std::string written;
};

// The decoded data, or "error: " and the Exception's text.
std::string Decode(std::string lzma, int failingRead = 0) {
    Stream input;
    Stream output;
    input.failingRead = failingRead;
    input.Attach(reinterpret_cast<uint8_t*>(&lzma[0]), static_cast<int32_t>(lzma.size()));
    try {
        DecodeLzma(input, output);
    } catch (const Exception& error) {
        return "error: " + error.message;
    }
    return output.written;
}

// Writes value over bytes bytes of the stream, lowest first.
std::string Patched(std::string lzma, size_t at, uint64_t value, int bytes = 1) {
    for (int i = 0; i < bytes; ++i) lzma[at + i] = static_cast<char>(value >> (8 * i));
    return lzma;
}

TEST(DecodeLzma, DecodesEveryShapeAndRefusesBrokenStreams) {
    const std::string dataError = "error: Data error, please verify that downloaded files are complete and correct!";
    const std::string allocationFailure = "error: Failed to allocate LZMA structures while decoding.";
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
    // Noise, so that the stream takes several reads.
    std::string noise(200000, '\0');
    uint32_t state = 1;
    for (char& c : noise) c = static_cast<char>((state = state * 1103515245u + 12345u) >> 24);
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
         "error: Missing data, please verify that downloaded files are complete!"},
        {"lc/lp/pb byte out of range", Patched(sized, 0, 225), allocationFailure},
        {"dictionary over the limit, size unknown", Patched(markedText, 1, kMaximumLzmaDictionarySize + 1, 4),
         allocationFailure},
        // Passed on unchanged, and (under the leak checker) after freeing
        // the decoder state.
        {"stream error in the loop", EncodeLzma(noise), "error: Failed to read data from file.", 3},
    };
    for (const auto& c : cases) {
        const std::string decoded = Decode(c.lzma, c.failingRead);
        EXPECT_TRUE(decoded == c.expected) << c.name << ": " << decoded.substr(0, 80);
    }
}

// A stopped extraction must never pass for a finished, shorter member.
TEST(DecodeLzma, AQuitRequestEndsWithAnError) {
    quitRequested = true;
    const std::string decoded = Decode(EncodeLzma("text"));
    quitRequested = false;
    EXPECT_EQ(decoded, "error: ");  // a cancel, which says nothing
}

// A member header claiming size bytes of data, and the data.
std::string Member(const std::string& name, const std::string& data, uint64_t size) {
    return Patched(static_cast<char>(name.size()) + name + "12345", name.size() + 1, size, 5) + data;
}
std::string Member(const std::string& name, const std::string& data) { return Member(name, data, data.size()); }

// The member's text, or the error message.
std::string Extract(const std::string& archiveBytes, const std::string& member) {
    TempFolder folder;
    WriteTextFile(folder / "a.pak", archiveBytes);
    try {
        PatchArchive(folder / "a.pak").DecodeFile(member, folder / "out");
        return ReadTextFile(folder / "out");
    } catch (const Exception& error) {
        return error.message;
    }
}

TEST(PatchArchive, FindsMembersByExactName) {
    // End markers instead of stated sizes: the decoder reads whole blocks and
    // must stop at the marker, whatever follows in the file.
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
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Extract(c.bytes, c.member),
                  c.found.empty() ? "Failed to find file in patch archive. File: " + c.member : c.found);
    }
}

// Member sizes have 40 bits: a member of more than 4 GiB is skipped by its
// full size. The file is sparse: written after a seek past its end.
TEST(PatchArchive, SkipsMembersLargerThanFourGibibytes) {
    TempFolder folder;
    const uint64_t hugeSize = (5ull << 30) + 17;
    const std::string header = Member("huge", "", hugeSize);
    const std::string after = Member("after", EncodeLzma("after"));
    WriteTextFile(folder / "huge.pak", header);
    FileStream file;
    file.OpenForWrite(folder / "huge.pak");
    file.Seek(static_cast<int64_t>(header.size() + hugeSize), 0);
    file.Write(after.data(), static_cast<uint32_t>(after.size()));
    file.Close();
    PatchArchive(folder / "huge.pak").DecodeFile("after", folder / "out");
    EXPECT_EQ(ReadTextFile(folder / "out"), "after");
}

}  // namespace
