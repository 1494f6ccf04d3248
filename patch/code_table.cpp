#include "patch/code_table.h"

namespace {

CodeTableEntry Make(uint32_t type1, uint8_t size1, uint8_t mode1, uint32_t type2 = kNoop, uint8_t size2 = 0,
                    uint8_t mode2 = 0) {
    return CodeTableEntry{Instruction{type1, size1, mode1}, Instruction{type2, size2, mode2}};
}

}  // namespace

const CodeTable& CodeTable::Default() {
    // A function-local static is initialised exactly once even when two
    // threads get here together.
    static const CodeTable table = [] {
        CodeTable built;
        constexpr uint8_t kModes = 9;  // self, here, 4 near, 3 same
        int i = 0;
        built.entries[i++] = Make(kRun, 0, 0);
        for (uint8_t size = 0; size <= 17; ++size) built.entries[i++] = Make(kAdd, size, 0);
        for (uint8_t mode = 0; mode < kModes; ++mode) {
            built.entries[i++] = Make(kCopy, 0, mode);
            for (uint8_t size = 4; size <= 18; ++size) built.entries[i++] = Make(kCopy, size, mode);
        }
        for (uint8_t mode = 0; mode < 6; ++mode) {
            for (uint8_t add = 1; add <= 4; ++add) {
                for (uint8_t copy = 4; copy <= 6; ++copy) built.entries[i++] = Make(kAdd, add, 0, kCopy, copy, mode);
            }
        }
        for (uint8_t mode = 6; mode < kModes; ++mode) {
            for (uint8_t add = 1; add <= 4; ++add) built.entries[i++] = Make(kAdd, add, 0, kCopy, 4, mode);
        }
        for (uint8_t mode = 0; mode < kModes; ++mode) built.entries[i++] = Make(kCopy, 4, mode, kAdd, 1, 0);
        return built;
    }();
    return table;
}

CodeTable::CodeTable(const Encoded& encoded) {
    for (int i = 0; i < kEntryCount; ++i) {
        entries[i].first = Instruction{encoded[i], encoded[2 * kEntryCount + i], encoded[4 * kEntryCount + i]};
        entries[i].second =
            Instruction{encoded[kEntryCount + i], encoded[3 * kEntryCount + i], encoded[5 * kEntryCount + i]};
    }
}

CodeTable::Encoded CodeTable::Encode() const {
    Encoded encoded{};
    for (int i = 0; i < kEntryCount; ++i) {
        encoded[i] = static_cast<uint8_t>(entries[i].first.type);
        encoded[kEntryCount + i] = static_cast<uint8_t>(entries[i].second.type);
        encoded[2 * kEntryCount + i] = entries[i].first.size;
        encoded[3 * kEntryCount + i] = entries[i].second.size;
        encoded[4 * kEntryCount + i] = entries[i].first.mode;
        encoded[5 * kEntryCount + i] = entries[i].second.mode;
    }
    return encoded;
}
