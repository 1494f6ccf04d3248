#pragma once

#include <cstdint>
#include <string>

#include "base/file_stream.h"

// A stream that collects whatever is written to it.
class StringOutput : public FileStream {
public:
    uint32_t Write(const void* source, uint32_t count) override {
        data.append(static_cast<const char*>(source), count);
        return count;
    }
    int64_t GetLength() override { return static_cast<int64_t>(data.size()); }

    std::string data;
};

// The text of the checked-in peer fixtures (see data/make_lzma_fixtures.sh).
std::string FixtureText();
// A file of tests/patch/data.
std::string ReadFixture(const std::string& name);
// Decodes one stand-alone LZMA stream held in memory.
std::string DecodeToString(const std::string& lzma);
// Expected XML written with "\n" turned into this platform's line break.
std::string WithPlatformLineBreaks(const std::string& text);
