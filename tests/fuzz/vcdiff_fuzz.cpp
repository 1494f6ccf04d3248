// Feeds the VCDIFF decoder arbitrary deltas. Input: a 2-byte little-endian
// source length, the source, then the delta. Every outcome but a clean
// decode or an Exception is a finding.
#include <cstddef>
#include <cstdint>
#include <vector>

#include "base/exception.h"
#include "base/memory_stream.h"
#include "patch/vcdiff_decoder.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 2) return 0;
    size_t sourceLength = data[0] | static_cast<size_t>(data[1]) << 8;
    if (sourceLength > size - 2) sourceLength = size - 2;
    std::vector<uint8_t> source(data + 2, data + 2 + sourceLength);
    std::vector<uint8_t> delta(data + 2 + sourceLength, data + size);
    // Room for a good deal more than any input could describe without
    // RUNs or copies; longer targets end in the decoder's write check.
    static std::vector<uint8_t> target(4 << 20);
    MemoryStream sourceStream;
    MemoryStream deltaStream;
    MemoryStream targetStream;
    sourceStream.Attach(source.data(), static_cast<int32_t>(source.size()));
    deltaStream.Attach(delta.data(), static_cast<int32_t>(delta.size()));
    targetStream.Attach(target.data(), static_cast<int32_t>(target.size()));
    try {
        VcdiffDecoder::Decode(&sourceStream, &deltaStream, &targetStream);
    } catch (const Exception&) {
    }
    return 0;
}
