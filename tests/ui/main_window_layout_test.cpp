// The numbers behind the main window's bar: which of its pieces are drawn
// and how long, and how the two progress reports make its total.

#include <gtest/gtest.h>

#include <tuple>

#include "ui/main_window_layout.h"
#include "ui/progress_meter.h"

namespace {

TEST(MainWindowLayout, BarLengthAndPieces) {
    const ProgressPieceWidths shipped{2, 2, 5};
    const struct {
        int32_t total;
        ProgressPieceWidths widths;
        std::tuple<int32_t, bool, bool, bool, int32_t> drawn;  // length, middle, begin, end, end's left
    } cases[] = {
        {0, shipped, {0, false, false, false, 21}},
        // The begin cap shows before the middle has any length, the end
        // cap once the total passes its width (left of the bar's origin).
        {3, shipped, {0, true, true, false, 21}},
        {6, shipped, {1, true, true, true, 22}},
        {1000, shipped, {330, true, true, true, 351}},
        // Pictures that could not be loaded are not drawn.
        {500, {0, 0, 0}, {165, false, false, false, 191}},
    };
    for (const auto& c : cases) {
        const ProgressBarPieces bar = LayOutProgressBar(c.total, c.widths);
        EXPECT_EQ(std::make_tuple(bar.length, bar.middle, bar.begin, bar.end, bar.endLeft), c.drawn) << c.total;
    }
}

TEST(ProgressMeter, WeighsTheReportsAndDropsThoseThatChangeNothing) {
    enum Report { Overall, File };
    const struct {
        Report report;
        int32_t permille;
        bool changed;
        int32_t total;
    } steps[] = {
        {Overall, 1, false, 0},                                    // 0.85 rounds down to nothing
        {File, 7, true, 1},                                        // each report is rounded down on its own
        {Overall, 501, true, 426},    {Overall, 500, false, 426},  // the same after weighting
        {Overall, 1000, true, 851},   {File, 1000, true, 1000},    // both complete fill the bar exactly
        {Overall, 2000, false, 1000},                              // and a report past the end no more
        {Overall, 0, true, 150},
    };
    ProgressMeter meter;
    for (const auto& step : steps) {
        const bool changed = step.report == Overall ? meter.SetOverall(step.permille) : meter.SetFile(step.permille);
        EXPECT_EQ(changed, step.changed) << step.report << " " << step.permille;
        EXPECT_EQ(meter.Total(), step.total) << step.report << " " << step.permille;
    }
}

}  // namespace
