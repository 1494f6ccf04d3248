#pragma once

#include <array>
#include <cstdint>

// Instruction types of a delta's instructions section.
enum InstructionType : uint32_t {
    kNoop = 0,
    kAdd = 1,
    kRun = 2,
    kCopy = 3,
};

// One half of a code table entry. A size of 0 means the size follows in the
// instructions section.
struct Instruction {
    uint32_t type = kNoop;
    uint8_t size = 0;
    uint8_t mode = 0;
};

struct CodeTableEntry {
    Instruction first;
    Instruction second;
};

// The table that maps each instruction byte to up to two instructions.
class CodeTable {
public:
    static constexpr int kEntryCount = 256;
    // A table travels as six rows of 256 bytes: the types of the first and
    // of the second instructions, then their sizes, then their modes.
    static constexpr int kEncodedSize = 6 * kEntryCount;
    using Encoded = std::array<uint8_t, kEncodedSize>;

    // The standard table (near cache 4, same cache 3). Built on first use
    // and never changed afterwards, so any number of decoders may share it.
    static const CodeTable& Default();

    explicit CodeTable(const Encoded& encoded);

    Encoded Encode() const;
    const CodeTableEntry& operator[](uint8_t index) const { return entries[index]; }

private:
    CodeTable() = default;

    std::array<CodeTableEntry, kEntryCount> entries{};
};
