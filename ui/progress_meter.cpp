#include "ui/progress_meter.h"

#include <algorithm>
#include <cmath>

namespace {
constexpr double kOverallWeight = 0.85;
constexpr double kFileWeight = 0.15;
}  // namespace

bool ProgressMeter::SetOverall(int32_t permille) { return Update(overallComponent, permille, kOverallWeight); }

bool ProgressMeter::SetFile(int32_t permille) { return Update(fileComponent, permille, kFileWeight); }

bool ProgressMeter::SetTotal(int32_t permille) {
    const int32_t value = std::clamp(permille, 0, 1000);
    return total.exchange(value) != value;
}

bool ProgressMeter::Update(int32_t& component, int32_t permille, double weight) {
    const auto weighted = static_cast<int32_t>(std::floor(permille * weight));
    if (weighted == component) return false;
    component = weighted;
    const int32_t sum = std::clamp(overallComponent + fileComponent, 0, 1000);
    if (sum == total) return false;
    total = sum;
    return true;
}
