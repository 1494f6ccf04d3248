// The decisions the main window takes from numbers alone: where a click
// lands, how long the bar is and which of its pieces are drawn, and how the
// two progress reports make the bar's total.

#include <gtest/gtest.h>

#include <vector>

#include "ui/main_window_layout.h"
#include "ui/progress_meter.h"

namespace {

TEST(MainWindowLayout, HitTestFindsTheCancelLabelAndTheCloseSpot) {
    struct Case {
        int32_t x, y;
        HitArea expected;
    };
    const Case cases[] = {
        {361, 431, HitArea::Cancel}, {508, 454, HitArea::Cancel}, {509, 440, HitArea::None}, {400, 455, HitArea::None},
        {360, 440, HitArea::None},   {504, 4, HitArea::Close},    {526, 26, HitArea::Close}, {527, 10, HitArea::None},
        {515, 3, HitArea::None},     {100, 15, HitArea::None},
    };
    for (const Case& c : cases) EXPECT_EQ(HitTest(c.x, c.y), c.expected) << c.x << "," << c.y;
}

TEST(MainWindowLayout, BarLengthAndPieces) {
    struct Case {
        int32_t total;
        ProgressPieceWidths widths;
        int32_t length;
        bool middle, begin, end;
        int32_t endLeft;
    };
    const ProgressPieceWidths shipped{2, 2, 5};
    const Case cases[] = {
        {0, shipped, 0, false, false, false, 21},
        // The begin cap shows before the middle has any length.
        {3, shipped, 0, true, true, false, 21},
        // All three, the end cap starting left of the bar's origin.
        {6, shipped, 1, true, true, true, 22},
        {500, shipped, 165, true, true, true, 186},
        {1000, shipped, 330, true, true, true, 351},
        // Pictures that could not be loaded are not drawn.
        {500, {0, 0, 0}, 165, false, false, false, 191},
    };
    for (const Case& c : cases) {
        const ProgressBarPieces pieces = LayOutProgressBar(c.total, c.widths);
        EXPECT_EQ(pieces.length, c.length) << c.total;
        EXPECT_EQ(pieces.middle, c.middle) << c.total;
        EXPECT_EQ(pieces.begin, c.begin) << c.total;
        EXPECT_EQ(pieces.end, c.end) << c.total;
        if (c.end) {
            EXPECT_EQ(pieces.endLeft, c.endLeft) << c.total;
        }
    }
}

TEST(ProgressMeter, WeighsTheReportsAndDropsThoseThatChangeNothing) {
    enum Report { Overall, File };
    struct Step {
        Report report;
        int32_t permille;
        bool changed;
        int32_t total;
    };
    const std::vector<std::vector<Step>> runs = {
        // Both complete fill the bar: 850 + 150.
        {{Overall, 1000, true, 850}, {File, 1000, true, 1000}},
        // 1 x 0.85 rounds down to nothing.
        {{Overall, 1, false, 0}, {File, 6, false, 0}, {File, 7, true, 1}},
        {{Overall, 500, true, 425}, {Overall, 501, false, 425}, {File, 7, true, 426}, {File, 6, true, 425}},
        // A report past the end fills the bar and no more.
        {{Overall, 2000, true, 1000}, {File, 1000, false, 1000}, {Overall, 0, true, 150}},
    };
    for (size_t run = 0; run < runs.size(); ++run) {
        ProgressMeter meter;
        for (const Step& step : runs[run]) {
            const bool changed =
                step.report == Overall ? meter.SetOverall(step.permille) : meter.SetFile(step.permille);
            EXPECT_EQ(changed, step.changed) << "run " << run << ", report " << step.permille;
            EXPECT_EQ(meter.Total(), step.total) << "run " << run << ", report " << step.permille;
        }
    }
}

}  // namespace
