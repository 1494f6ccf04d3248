#pragma once

#include <cstdint>
#include <functional>
#include <string>

class FileStream;

// How a stand-alone LZMA stream is made with the SDK encoder.
struct LzmaOptions {
    int level = 5;                // 0..9, as the SDK's lzma tool
    uint32_t dictionarySize = 0;  // 0: the level's default, cut to the data
    int lc = 3;
    int lp = 0;
    int pb = 2;
    bool storeSize = true;   // false: size field all ones, end marker
    bool endMarker = false;  // an end marker also when the size is stored
};

using ByteSink = std::function<void(const uint8_t* data, size_t size)>;

// Reads exactly size bytes from source and passes the 13-byte header and
// the compressed data to sink. Throws Exception when the encoder fails or
// the source ends early; an exception thrown by the sink passes on.
void EncodeLzma(FileStream& source, uint64_t size, const LzmaOptions& options, const ByteSink& sink);
std::string EncodeLzma(const std::string& data, const LzmaOptions& options = LzmaOptions());
