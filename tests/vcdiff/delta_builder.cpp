#include "tests/vcdiff/delta_builder.h"

#include <vector>

#include "patch/code_table.h"
#include "patch/exception.h"
#include "patch/memory_stream.h"
#include "patch/vcdiff_decoder.h"

std::string Varint(uint32_t value) {
    std::string bytes(1, static_cast<char>(value & 0x7F));
    while (value >>= 7) bytes.insert(bytes.begin(), static_cast<char>(0x80 | (value & 0x7F)));
    return bytes;
}

std::string Header(uint8_t indicator) { return std::string("\xD6\xC3\xC4\x00", 4) + static_cast<char>(indicator); }

std::string AddOp(uint32_t size) { return "\x01" + Varint(size); }
std::string RunOp(uint32_t size) { return std::string(1, '\0') + Varint(size); }
std::string CopyOp(uint32_t size, uint8_t mode) { return static_cast<char>(19 + 16 * mode) + Varint(size); }

std::string Window(const WindowSpec& spec) {
    std::string body = Varint(spec.targetLength) + static_cast<char>(spec.deltaIndicator) +
                       Varint(static_cast<uint32_t>(spec.data.size())) +
                       Varint(static_cast<uint32_t>(spec.instructions.size())) +
                       Varint(static_cast<uint32_t>(spec.addresses.size()));
    if (spec.indicator & 0x04) {
        for (int shift = 24; shift >= 0; shift -= 8) body += static_cast<char>((spec.checksum >> shift) & 0xFF);
    }
    body += spec.data + spec.instructions + spec.addresses;
    std::string window(1, static_cast<char>(spec.indicator));
    if (spec.indicator & 0x03) window += Varint(spec.segmentLength) + Varint(spec.segmentPosition);
    return window + Varint(static_cast<uint32_t>(static_cast<int32_t>(body.size()) + spec.encodingLengthError)) + body;
}

std::string CodeTableSection(const std::string& table, uint8_t nearSize, uint8_t sameSize) {
    // Runs that match the default table are copied from it (the source of
    // the table's own delta); the rest is added.
    const CodeTable::Encoded standard = CodeTable::Default().Encode();
    WindowSpec spec;
    spec.indicator = 0x01;
    spec.segmentLength = CodeTable::kEncodedSize;
    spec.targetLength = static_cast<uint32_t>(table.size());
    for (size_t i = 0; i < table.size();) {
        const bool same = i < standard.size() && static_cast<uint8_t>(table[i]) == standard[i];
        size_t end = i;
        while (end < table.size() &&
               (end < standard.size() && static_cast<uint8_t>(table[end]) == standard[end]) == same) {
            ++end;
        }
        const uint32_t length = static_cast<uint32_t>(end - i);
        if (same) {
            spec.instructions += CopyOp(length, 0);
            spec.addresses += Varint(static_cast<uint32_t>(i));
        } else {
            spec.instructions += AddOp(length);
            spec.data += table.substr(i, length);
        }
        i = end;
    }
    const std::string compressed = Header() + Window(spec);
    return Varint(static_cast<uint32_t>(compressed.size() + 2)) + static_cast<char>(nearSize) +
           static_cast<char>(sameSize) + compressed;
}

DecodeResult DecodeInMemory(const std::string& source, const std::string& delta, size_t capacity) {
    std::vector<uint8_t> sourceBytes(source.begin(), source.end());
    std::vector<uint8_t> deltaBytes(delta.begin(), delta.end());
    std::vector<uint8_t> targetBytes(capacity);
    MemoryStream sourceStream;
    MemoryStream deltaStream;
    MemoryStream targetStream;
    sourceStream.Attach(sourceBytes.data(), static_cast<int32_t>(sourceBytes.size()));
    deltaStream.Attach(deltaBytes.data(), static_cast<int32_t>(deltaBytes.size()));
    targetStream.Attach(targetBytes.data(), static_cast<int32_t>(targetBytes.size()));
    DecodeResult result;
    try {
        VcdiffDecoder::Decode(&sourceStream, &deltaStream, &targetStream);
    } catch (const Exception& error) {
        result.error = error.message;
        result.code = error.code;
    }
    result.target.assign(targetBytes.begin(), targetBytes.begin() + targetStream.GetPosition());
    return result;
}
