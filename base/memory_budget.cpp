#include "base/memory_budget.h"

MemoryBudget::Reservation::Reservation(MemoryBudget* owner, uint64_t size) : budget(owner), bytes(size) {
    if (budget == nullptr) return;
    std::unique_lock<std::mutex> lock(budget->mutex);
    budget->released.wait(lock, [&] { return budget->held == 0 || budget->held + bytes <= budget->limit; });
    budget->held += bytes;
}

MemoryBudget::Reservation::~Reservation() {
    if (budget == nullptr) return;
    {
        std::lock_guard<std::mutex> lock(budget->mutex);
        budget->held -= bytes;
    }
    budget->released.notify_all();
}
