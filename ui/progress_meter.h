#pragma once

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

    int32_t Total() const { return total; }

private:
    bool Update(int32_t& component, int32_t permille, double weight);

    int32_t total = 0;
    int32_t overallComponent = 0;
    int32_t fileComponent = 0;
};
