// How PatchArchive finds members: names byte for byte, the first of equal
// names, empty members missing, and broken headers never read past the
// end of the file.
#include <gtest/gtest.h>

#include <string>

#include "base/exception.h"
#include "patch/patch_archive.h"
#include "tests/support/format_test_helpers.h"
#include "tests/support/test_files.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

std::string Member(const std::string& name, const std::string& data) {
    std::string bytes(1, static_cast<char>(name.size()));
    bytes += name;
    for (int i = 0; i < 5; ++i) bytes += static_cast<char>(static_cast<uint64_t>(data.size()) >> (8 * i));
    return bytes + data;
}

// A member header claiming dataSize bytes, whatever follows.
std::string Header(const std::string& name, uint64_t dataSize) {
    std::string bytes(1, static_cast<char>(name.size()));
    bytes += name;
    for (int i = 0; i < 5; ++i) bytes += static_cast<char>(dataSize >> (8 * i));
    return bytes;
}

const char kNotFound[] = "Failed to find file in patch archive. File: ";

// The outcome of DecodeFile: the member's text, or the error message.
std::string Extract(const std::string& archiveBytes, const std::string& member) {
    TempFolder folder;
    WriteTextFile(folder / "a.pak", archiveBytes);
    try {
        PatchArchive(folder / "a.pak").DecodeFile(member, folder / "out");
        return ReadTextFile(folder / "out");
    } catch (const Exception& error) {
        if (error.message.rfind(kNotFound, 0) == 0) {
            EXPECT_EQ(ReadTextFile(folder / "out").size(), 0u) << "a failed lookup leaves an empty destination";
        }
        return error.message;
    }
}

TEST(PatchArchive, FindsMembersByExactName) {
    const std::string one = Member("data\\one.txt", EncodeLzma("first"));
    const std::string two = Member("data\\two.txt", EncodeLzma("second"));
    const std::string twin = Member("data\\one.txt", EncodeLzma("shadowed"));
    const std::string empty = Member("empty.txt", "");
    const std::string archive = one + two + twin + empty;

    const struct {
        const char* name;
        std::string bytes;
        std::string member;
        std::string expected;
    } cases[] = {
        {"first member", archive, "data\\one.txt", "first"},
        {"member after another", archive, "data\\two.txt", "second"},
        {"first of two equal names wins", two + twin + one, "data\\one.txt", "shadowed"},
        {"letter case counts", archive, "DATA\\ONE.TXT", std::string(kNotFound) + "DATA\\ONE.TXT"},
        {"a prefix is not the name", archive, "data\\one", std::string(kNotFound) + "data\\one"},
        {"a name with no data is missing", archive, "empty.txt", std::string(kNotFound) + "empty.txt"},
        {"missing name", archive, "nope", std::string(kNotFound) + "nope"},
        {"empty archive", "", "data\\one.txt", std::string(kNotFound) + "data\\one.txt"},
        {"five bytes hold no member", std::string("\0\0\0\0\0", 5), "", std::string(kNotFound)},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(Extract(c.bytes, c.member), c.expected);
    }
}

TEST(PatchArchive, BrokenHeadersEndTheScanAsNotFound) {
    const std::string good = Member("good", EncodeLzma("good data"));
    const struct {
        const char* name;
        std::string bytes;
    } cases[] = {
        {"name runs past the end", good + std::string(1, '\xFF') + "short"},
        {"size bytes cut off", good + std::string(1, '\4') + "name" + "\x01\x02"},
        {"matching member larger than the file", Header("wanted", 1000) + EncodeLzma("x")},
        {"earlier member larger than the file", Header("other", 1ull << 39) + Member("wanted", EncodeLzma("x"))},
        {"largest 40-bit size", Header("other", (1ull << 40) - 1) + Member("wanted", EncodeLzma("x"))},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(Extract(c.bytes, "wanted"), std::string(kNotFound) + "wanted");
    }
    // The good member before a broken tail is still found.
    EXPECT_EQ(Extract(good + std::string(1, '\xFF') + "short", "good"), "good data");
}

TEST(PatchArchive, DecodingMayReadIntoTheNextMember) {
    // The decoder reads whole blocks; a stream with an end marker stops at
    // its marker, whatever follows it in the file.
    LzmaOptions marked;
    marked.storeSize = false;
    const std::string archive = Member("a", EncodeLzma("alpha", marked)) + Member("b", EncodeLzma("beta", marked));
    EXPECT_EQ(Extract(archive, "a"), "alpha");
    EXPECT_EQ(Extract(archive, "b"), "beta");
}

TEST(PatchArchive, ReportsMissingArchivesAndCorruptMembers) {
    TempFolder folder;
    try {
        PatchArchive(folder / "missing.pak").DecodeFile("x", folder / "out");
        FAIL() << "no error";
    } catch (const Exception& error) {
        EXPECT_EQ(error.message, "Failed to open file: " + (folder / "missing.pak"));
    }
    // The destination exists (empty) before the archive is even opened.
    EXPECT_TRUE(PathExists(folder / "out"));

    std::string corrupt = EncodeLzma(std::string(200000, 'z'));
    corrupt.resize(corrupt.size() / 2);
    EXPECT_EQ(Extract(Member("cut", corrupt), "cut"),
              "Data error, please verify that downloaded files are complete and correct!");
}

}  // namespace
