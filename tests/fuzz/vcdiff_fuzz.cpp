// The VCDIFF decoder on arbitrary deltas. Input: a 2-byte little-endian
// source length, the source, then the delta.
#include <algorithm>
#include <vector>

#include "base/memory_stream.h"
#include "patch/vcdiff_decoder.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 2) return 0;
    const size_t sourceLength = std::min<size_t>(data[0] | data[1] << 8, size - 2);
    // Separate buffers, so that a read past either one is caught.
    std::vector<uint8_t> sourceBytes(data + 2, data + 2 + sourceLength),
        deltaBytes(data + 2 + sourceLength, data + size);
    // Room for a good deal more than any input could describe without
    // RUNs or copies; longer targets end in the decoder's write check.
    static std::vector<uint8_t> target(4 << 20);
    MemoryStream source, delta, output;
    source.Attach(sourceBytes.data(), static_cast<int32_t>(sourceBytes.size()));
    delta.Attach(deltaBytes.data(), static_cast<int32_t>(deltaBytes.size()));
    output.Attach(target.data(), static_cast<int32_t>(target.size()));
    ExpectNoCrash([&] { VcdiffDecoder::Decode(&source, &delta, &output); });
    return 0;
}
