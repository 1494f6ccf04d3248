// Deltas made by xdelta3 at build time (see make_xdelta3_cases.py) decode
// bit for bit, with and without window checksums, and xdelta3's default
// output is refused for its secondary compressor.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "patch/vcdiff_decoder.h"
#include "tests/support/test_files.h"

namespace {

struct Case {
    std::string kind;  // "decode" or "reject"
    std::string source;
    std::string delta;
    std::string expected;  // the target file, or the error text
};

std::string CasePath(const std::string& name) { return PathJoin(VCDIFF_CASES_DIR, name); }

std::vector<Case> ReadManifest() {
    std::ifstream manifest(CasePath("manifest.txt"));
    std::vector<Case> cases;
    std::string line;
    while (std::getline(manifest, line)) {
        std::istringstream fields(line);
        Case c;
        fields >> c.kind >> c.source >> c.delta >> std::ws;
        std::getline(fields, c.expected);
        cases.push_back(c);
    }
    return cases;
}

// Decodes with files, as the updater does; returns the error text or "".
std::string DecodeFiles(const Case& c, const std::string& targetPath) {
    FileStream source;
    FileStream delta;
    FileStream target;
    try {
        source.Open(CasePath(c.source));
        delta.Open(CasePath(c.delta));
        target.Create(targetPath);
        VcdiffDecoder::Decode(&source, &delta, &target);
    } catch (const Exception& error) {
        return error.message;
    }
    return "";
}

TEST(Xdelta3Interop, EveryCaseDecodesBitExactOrIsRefused) {
    const std::vector<Case> cases = ReadManifest();
    ASSERT_GE(cases.size(), 20u) << "interop cases missing from " << VCDIFF_CASES_DIR;
    TempFolder folder;
    for (const Case& c : cases) {
        const std::string targetPath = folder / "target";
        const std::string error = DecodeFiles(c, targetPath);
        if (c.kind == "decode") {
            EXPECT_EQ(error, "") << c.delta;
            EXPECT_TRUE(ReadTextFile(targetPath) == ReadTextFile(CasePath(c.expected))) << c.delta;
        } else {
            EXPECT_EQ(error, c.expected) << c.delta;
        }
    }
}

}  // namespace
