#include "tests/support/format_test_helpers.h"

#include "base/memory_stream.h"
#include "base/paths.h"
#include "base/xml_file.h"
#include "patch/lzma_decoder.h"
#include "tests/support/test_files.h"

std::string FixtureText() {
    std::string text;
    for (int i = 0; i < 3000; ++i) {
        text += "line " + std::to_string(i) + " of the fixture, value " + std::to_string(i * 7919 % 10007) + "\n";
    }
    return text;
}

std::string ReadFixture(const std::string& name) {
    return ReadTextFile(PathJoin(PathJoin(IRONVALE_SOURCE_DIR, "tests/patch/data"), name));
}

std::string DecodeToString(const std::string& lzma) {
    std::string input = lzma;
    MemoryStream source;
    source.Attach(reinterpret_cast<uint8_t*>(&input[0]), static_cast<int32_t>(input.size()));
    StringOutput output;
    DecodeLzma(source, output);
    return output.data;
}

std::string WithPlatformLineBreaks(const std::string& text) {
    std::string result;
    for (char c : text) {
        if (c == '\n') {
            result += kXmlLineBreak;
        } else {
            result += c;
        }
    }
    return result;
}
