#pragma once

#include <atomic>
#include <cstdint>

// The progress bar's value (0..1000) from two reports: the overall
// progress of the update fills at most 850 units and the progress of the
// file being patched at most 150, so the bar is full only when both are.
class ProgressMeter {
public:
    // Each returns true when the total changed and the bar must be
    // redrawn; a report that changes nothing after weighting is dropped.
    bool SetOverall(int32_t permille);
    bool SetFile(int32_t permille);
    // Sets the bar itself, past the two reports: the version check fills
    // it on its own while the latest-version file arrives. True when it
    // changed.
    bool SetTotal(int32_t permille);

    int32_t Total() const { return total; }

private:
    bool Update(int32_t& component, int32_t permille, double weight);

    // Written by the version check on the main thread, read by the
    // painting thread.
    std::atomic<int32_t> total{0};
    int32_t overallComponent = 0;
    int32_t fileComponent = 0;
};
