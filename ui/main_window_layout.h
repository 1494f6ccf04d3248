#pragma once

#include <cstdint>

// Where things are in the main window, in client pixels. The numbers fit
// the shipped pictures (resources/pictures); change them together.

struct PixelPoint {
    int32_t x;
    int32_t y;
};

// Left and top inside, right and bottom outside (as Windows counts).
struct PixelRect {
    int32_t left;
    int32_t top;
    int32_t right;
    int32_t bottom;

    bool Contains(int32_t x, int32_t y) const { return x >= left && x < right && y >= top && y < bottom; }
};

namespace MainWindowLayout {
// When the background picture cannot be loaded.
constexpr int32_t kFallbackWidth = 500;
constexpr int32_t kFallbackHeight = 500;
// Pixels of this colour are transparent.
constexpr uint8_t kColourKeyRed = 236;
constexpr uint8_t kColourKeyGreen = 0;
constexpr uint8_t kColourKeyBlue = 140;

constexpr PixelPoint kTitleOrigin{11, 5};
constexpr PixelPoint kDefaultPictureOrigin{14, 38};
constexpr PixelPoint kStatusTextOrigin{22, 408};
constexpr PixelRect kStatusTextRect{22, 408, 322, 436};
constexpr PixelPoint kProgressOrigin{26, 432};
constexpr int32_t kProgressFullLength = 330;
constexpr PixelRect kProgressRect{26, 432, 355, 454};
constexpr PixelRect kCancelRect{361, 431, 509, 455};
constexpr PixelPoint kCancelLabelOrigin{435, 432};
constexpr PixelRect kCloseRect{504, 4, 527, 27};
}  // namespace MainWindowLayout

// The two places a click asks to leave.
enum class HitArea { None, Cancel, Close };

HitArea HitTest(int32_t x, int32_t y);

// The lexicon key of the question that confirms leaving through area.
const char* ConfirmationTextKey(HitArea area);

// The widths in pixels of the bar's three pictures; 0 for a picture that
// could not be loaded.
struct ProgressPieceWidths {
    int32_t middle;
    int32_t begin;
    int32_t end;
};

// What the bar draws for a progress total (0..1000): the middle piece
// stretched to length, the begin piece at the origin, the end piece
// ending at the bar's length.
struct ProgressBarPieces {
    int32_t length = 0;
    bool middle = false;
    bool begin = false;
    bool end = false;
    int32_t endLeft = 0;
};

ProgressBarPieces LayOutProgressBar(int32_t total, const ProgressPieceWidths& widths);
