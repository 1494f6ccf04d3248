#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "patch/address_cache.h"
#include "patch/code_table.h"
#include "patch/exception.h"

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
        {0, kRun, 0, 0, kNoop, 0, 0},     {1, kAdd, 0, 0, kNoop, 0, 0},     {18, kAdd, 17, 0, kNoop, 0, 0},
        {19, kCopy, 0, 0, kNoop, 0, 0},   {20, kCopy, 4, 0, kNoop, 0, 0},   {34, kCopy, 18, 0, kNoop, 0, 0},
        {35, kCopy, 0, 1, kNoop, 0, 0},   {162, kCopy, 18, 8, kNoop, 0, 0}, {163, kAdd, 1, 0, kCopy, 4, 0},
        {165, kAdd, 1, 0, kCopy, 6, 0},   {166, kAdd, 2, 0, kCopy, 4, 0},   {234, kAdd, 4, 0, kCopy, 6, 5},
        {235, kAdd, 1, 0, kCopy, 4, 6},   {246, kAdd, 4, 0, kCopy, 4, 8},   {247, kCopy, 4, 0, kAdd, 1, 0},
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

TEST(CodeTable, DefaultTableIsOneObjectForAllThreads) {
    std::vector<const CodeTable*> seen(4);
    std::vector<std::thread> threads;
    for (size_t i = 0; i < seen.size(); ++i) threads.emplace_back([&seen, i] { seen[i] = &CodeTable::Default(); });
    for (std::thread& thread : threads) thread.join();
    for (const CodeTable* table : seen) EXPECT_EQ(table, &CodeTable::Default());
}

TEST(AddressCache, SlotsAreClearedAtEveryReset) {
    AddressCache cache(AddressCache::kDefaultNearSize, AddressCache::kDefaultSameSize);
    uint8_t first[] = {7};
    cache.Reset(first, 1);
    EXPECT_EQ(cache.DecodeAddress(0, 100), 7u);
    uint8_t second[] = {0, 7};
    cache.Reset(second, 2);
    EXPECT_EQ(cache.DecodeAddress(2, 100), 0u);  // near slot 0 forgot the 7
    EXPECT_EQ(cache.DecodeAddress(6, 100), 0u);  // so did the same slot for 7
    EXPECT_EQ(cache.Remaining(), 0);
}

TEST(AddressCache, NearSlotsRotateAndResizeStartsOver) {
    AddressCache cache(2, 0);
    uint8_t addresses[] = {10, 20, 30, 1, 0};
    cache.Reset(addresses, sizeof addresses);
    EXPECT_EQ(cache.DecodeAddress(0, 100), 10u);  // slot 0
    EXPECT_EQ(cache.DecodeAddress(0, 100), 20u);  // slot 1
    EXPECT_EQ(cache.DecodeAddress(0, 100), 30u);  // slot 0 again
    EXPECT_EQ(cache.DecodeAddress(3, 100), 21u);  // slot 1 (20) + 1
    cache.Resize(0, 1);
    EXPECT_EQ(cache.DecodeAddress(2, 100), 0u);            // mode 2 is now the same block, and empty
    EXPECT_THROW(cache.DecodeAddress(3, 100), Exception);  // and nothing lies past it
}

}  // namespace
