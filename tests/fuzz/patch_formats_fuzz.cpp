// The binary formats of a patch on arbitrary bytes: every input must end in a result or an Exception, within bounded
// memory. Each input goes to the archive scan, whose first member reaches the LZMA decoder, and to the VCDIFF decoder
// (as a 2-byte little-endian source length, the source, then the delta), so the seeds of each format serve its parser.
#include <algorithm>
#include <vector>

#include "base/memory_stream.h"
#include "patch/patch_archive.h"
#include "patch/vcdiff_decoder.h"
#include "tests/fuzz/fuzz_files.h"

namespace {

// Whether the stream header at data asks for at most 1 MiB of dictionary (after the cut to a stated size). Larger ones
// pass one comparison that the unit tests cover, but cost ASan time per megabyte: left out for pace.
bool ModestDictionary(const uint8_t* data, size_t size) {
    if (size < 13) return true;
    uint64_t dictionary = 0, unpacked = 0;  // an unknown size is all ones
    for (int i = 3; i >= 0; --i) dictionary = (dictionary << 8) | data[1 + i];
    for (int i = 7; i >= 0; --i) unpacked = (unpacked << 8) | data[5 + i];
    return std::min(dictionary, unpacked) <= (1u << 20);
}

void DecodeVcdiff(const uint8_t* data, size_t size) {
    if (size < 2) return;
    const size_t sourceLength = std::min<size_t>(data[0] | data[1] << 8, size - 2);
    // Separate buffers, so that a read past either one is caught.
    std::vector<uint8_t> sourceBytes(data + 2, data + 2 + sourceLength),
        deltaBytes(data + 2 + sourceLength, data + size);
    // Room for a good deal more than any input could describe without RUNs or copies; longer targets end in the
    // decoder's write check.
    static std::vector<uint8_t> target(4 << 20);
    MemoryStream source, delta, output;
    source.Attach(sourceBytes.data(), static_cast<int32_t>(sourceBytes.size()));
    delta.Attach(deltaBytes.data(), static_cast<int32_t>(deltaBytes.size()));
    output.Attach(target.data(), static_cast<int32_t>(target.size()));
    ExpectNoCrash([&] { VcdiffDecoder::Decode(&source, &delta, &output); });
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    DecodeVcdiff(data, size);
    const std::string archive = WriteFuzzFile("archive.pak", data, size);
    const std::string output = PathJoin(FuzzFolder(), "member.out");
    // The first member's own name reaches the decoder; a missing name makes the scan walk every header.
    const size_t nameLength = size == 0 ? 0 : std::min<size_t>(data[0], size - 1);
    const size_t firstData = size == 0 ? 0 : std::min<size_t>(size, 1 + nameLength + 5);
    if (ModestDictionary(data + firstData, size - firstData)) {
        const std::string first(reinterpret_cast<const char*>(data) + (size == 0 ? 0 : 1), nameLength);
        ExpectNoCrash([&] { PatchArchive(archive).DecodeFile(first, output); });
    }
    ExpectNoCrash([&] { PatchArchive(archive).DecodeFile("missing", output); });
    return 0;
}
