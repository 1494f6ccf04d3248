#include "patch/code_table.h"

#include <gtest/gtest.h>

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
