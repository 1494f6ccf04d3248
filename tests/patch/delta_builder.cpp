#include "tests/patch/delta_builder.h"

#include <vector>

#include "base/exception.h"
#include "base/memory_stream.h"
#include "patch/code_table.h"
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

std::string Window(const WindowLayout& layout) {
    std::string body = Varint(layout.targetLength) + static_cast<char>(layout.deltaIndicator) +
                       Varint(static_cast<uint32_t>(layout.data.size())) +
                       Varint(static_cast<uint32_t>(layout.instructions.size())) +
                       Varint(static_cast<uint32_t>(layout.addresses.size()));
    if (layout.indicator & 0x04) {
        for (int shift = 24; shift >= 0; shift -= 8) body += static_cast<char>((layout.checksum >> shift) & 0xFF);
    }
    body += layout.data + layout.instructions + layout.addresses;
    std::string window(1, static_cast<char>(layout.indicator));
    if (layout.indicator & 0x03) window += Varint(layout.segmentLength) + Varint(layout.segmentPosition);
    return window + Varint(static_cast<uint32_t>(static_cast<int32_t>(body.size()) + layout.encodingLengthError)) +
           body;
}

std::string CodeTableSection(const std::string& table, uint8_t nearSize, uint8_t sameSize) {
    // Runs that match the default table are copied from it (the source of
    // the table's own delta); the rest is added.
    const CodeTable::Encoded standard = CodeTable::Default().Encode();
    WindowLayout layout;
    layout.indicator = 0x01;
    layout.segmentLength = CodeTable::kEncodedSize;
    layout.targetLength = static_cast<uint32_t>(table.size());
    for (size_t i = 0; i < table.size();) {
        const bool same = i < standard.size() && static_cast<uint8_t>(table[i]) == standard[i];
        size_t end = i;
        while (end < table.size() &&
               (end < standard.size() && static_cast<uint8_t>(table[end]) == standard[end]) == same) {
            ++end;
        }
        const uint32_t length = static_cast<uint32_t>(end - i);
        if (same) {
            layout.instructions += CopyOp(length, 0);
            layout.addresses += Varint(static_cast<uint32_t>(i));
        } else {
            layout.instructions += AddOp(length);
            layout.data += table.substr(i, length);
        }
        i = end;
    }
    const std::string compressed = Header() + Window(layout);
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
