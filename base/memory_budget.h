#pragma once

#include <condition_variable>
#include <cstdint>
#include <mutex>

// The bytes that workers running side by side may hold at once. A worker
// reserves what it is about to allocate and waits while that would take
// the total past the budget; a need larger than the whole budget waits
// until nothing else is held and then runs alone, so nothing waits for
// ever and peak memory is the budget or the largest single need.
class MemoryBudget {
public:
    explicit MemoryBudget(uint64_t bytes) : limit(bytes) {}
    MemoryBudget(const MemoryBudget&) = delete;
    MemoryBudget& operator=(const MemoryBudget&) = delete;

    // Held from its making to its end; nothing when made without a budget.
    class Reservation {
    public:
        Reservation(MemoryBudget* budget, uint64_t bytes);
        Reservation(const Reservation&) = delete;
        Reservation& operator=(const Reservation&) = delete;
        ~Reservation();

    private:
        MemoryBudget* const budget;
        const uint64_t bytes;
    };

private:
    const uint64_t limit;
    std::mutex mutex;
    std::condition_variable released;
    uint64_t held = 0;
};
