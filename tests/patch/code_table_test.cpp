#include "patch/code_table.h"

#include <gtest/gtest.h>

#include <vector>

#include "base/exception.h"
#include "patch/checksum.h"

namespace {

struct Expected {
    int index;
    uint32_t type1;
    uint8_t size1;
    uint8_t mode1;
    uint32_t type2;
    uint8_t size2;
    uint8_t mode2;
};

// The boundaries of every group of the standard table.
TEST(CodeTable, DefaultTableGroupBoundaries) {
    const Expected rows[] = {
        {0, kRun, 0, 0, kNoop, 0, 0},   {1, kAdd, 0, 0, kNoop, 0, 0},     {18, kAdd, 17, 0, kNoop, 0, 0},
        {19, kCopy, 0, 0, kNoop, 0, 0}, {20, kCopy, 4, 0, kNoop, 0, 0},   {34, kCopy, 18, 0, kNoop, 0, 0},
        {35, kCopy, 0, 1, kNoop, 0, 0}, {162, kCopy, 18, 8, kNoop, 0, 0}, {163, kAdd, 1, 0, kCopy, 4, 0},
        {165, kAdd, 1, 0, kCopy, 6, 0}, {166, kAdd, 2, 0, kCopy, 4, 0},   {234, kAdd, 4, 0, kCopy, 6, 5},
        {235, kAdd, 1, 0, kCopy, 4, 6}, {246, kAdd, 4, 0, kCopy, 4, 8},   {247, kCopy, 4, 0, kAdd, 1, 0},
        {255, kCopy, 4, 8, kAdd, 1, 0},
    };
    const CodeTable& table = CodeTable::Default();
    for (const Expected& row : rows) {
        const CodeTableEntry& entry = table[static_cast<uint8_t>(row.index)];
        EXPECT_EQ(entry.first.type, row.type1) << row.index;
        EXPECT_EQ(entry.first.size, row.size1) << row.index;
        EXPECT_EQ(entry.first.mode, row.mode1) << row.index;
        EXPECT_EQ(entry.second.type, row.type2) << row.index;
        EXPECT_EQ(entry.second.size, row.size2) << row.index;
        EXPECT_EQ(entry.second.mode, row.mode2) << row.index;
    }
    EXPECT_EQ(CodeTable(table.Encode()).Encode(), table.Encode());
}

}  // namespace

TEST(ChecksumTest, IsAdler32) {
    const uint8_t abc[] = {'a', 'b', 'c'};
    EXPECT_EQ(Checksum(abc, 3), 0x024D0127u);
    EXPECT_EQ(Checksum(abc, 0), 1u);
    EXPECT_THROW(Checksum(nullptr, 3), Exception);
    // Long runs of 0xFF exercise the block reduction (a and b near overflow).
    std::vector<uint8_t> ones(100000, 0xFF);
    uint32_t a = 1, b = 0;
    for (uint8_t byte : ones) {
        a = (a + byte) % 65521;
        b = (b + a) % 65521;
    }
    EXPECT_EQ(Checksum(ones.data(), static_cast<int64_t>(ones.size())), (b << 16) | a);
}
