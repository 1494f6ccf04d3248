#include <algorithm>
#include <cstdint>
#include <string>

#include "tests/support/batch_fixture.h"

namespace {

std::string Varint(uint32_t value) {
    std::string bytes(1, static_cast<char>(value & 0x7F));
    while (value >>= 7) bytes.insert(bytes.begin(), static_cast<char>(0x80 | (value & 0x7F)));
    return bytes;
}

}  // namespace

// A Windows test program cannot start the Linux xdelta3, so here the delta
// is written directly: one window that copies the common prefix from the
// old file and adds the rest. The applier's handling of real xdelta3
// output is covered by the native run.
void MakeDelta(const std::string& oldPath, const std::string& newPath, const std::string& deltaPath) {
    const std::string oldData = ReadTextFile(oldPath);
    const std::string newData = ReadTextFile(newPath);
    size_t prefix = 0;
    while (prefix < oldData.size() && prefix < newData.size() && oldData[prefix] == newData[prefix]) ++prefix;
    std::string delta("\xD6\xC3\xC4\x00\x00", 5);
    if (!newData.empty()) {
        std::string instructions;
        std::string addresses;
        if (prefix > 0) {
            instructions += static_cast<char>(19) + Varint(static_cast<uint32_t>(prefix));  // COPY, mode 0
            addresses += Varint(0);
        }
        const std::string added = newData.substr(prefix);
        if (!added.empty()) instructions += static_cast<char>(1) + Varint(static_cast<uint32_t>(added.size()));
        const std::string body = Varint(static_cast<uint32_t>(newData.size())) + std::string(1, '\0') +
                                 Varint(static_cast<uint32_t>(added.size())) +
                                 Varint(static_cast<uint32_t>(instructions.size())) +
                                 Varint(static_cast<uint32_t>(addresses.size())) + added + instructions + addresses;
        delta += prefix > 0 ? '\x01' : '\x00';
        if (prefix > 0) delta += Varint(static_cast<uint32_t>(prefix)) + Varint(0);
        delta += Varint(static_cast<uint32_t>(body.size())) + body;
    }
    WriteTextFile(deltaPath, delta);
}
