#include "ui/main_window_layout.h"

HitArea HitTest(int32_t x, int32_t y) {
    if (MainWindowLayout::kCloseRect.Contains(x, y)) return HitArea::Close;
    if (MainWindowLayout::kCancelRect.Contains(x, y)) return HitArea::Cancel;
    return HitArea::None;
}

const char* ConfirmationTextKey(HitArea area) {
    return area == HitArea::Close ? "INSTALLER_CONFIRM_QUIT" : "INSTALLER_CONFIRM_CANCEL";
}

ProgressBarPieces LayOutProgressBar(int32_t total, const ProgressPieceWidths& widths) {
    ProgressBarPieces pieces;
    // The fraction is rounded to single precision first, as the drawing
    // code works in single precision.
    const float fraction = static_cast<float>(total) / 1000.0f;
    pieces.length = static_cast<int32_t>(fraction * static_cast<float>(MainWindowLayout::kProgressFullLength));
    pieces.middle = total > 0 && widths.middle > 0;
    // The caps compare the total itself with their width: a bar just
    // started shows its begin cap before the middle has any length, and
    // the end cap once the total passes its width.
    pieces.begin = widths.begin > 0 && total >= widths.begin;
    pieces.end = widths.end > 0 && total > widths.end;
    pieces.endLeft = MainWindowLayout::kProgressOrigin.x + pieces.length - widths.end;
    return pieces;
}
