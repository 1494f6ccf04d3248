#!/usr/bin/python3
"""Measures the updater's main window on a screenshot of the X server.

usage: window_picture.py SCREENSHOT LEFT TOP BACKGROUND

LEFT TOP: where the window is on the screen; BACKGROUND: the window's
background picture. Compares the screen with that picture and prints:
  bar N          columns of the progress bar drawn, from its origin on
  title N        pixels of the title area that differ from the picture
  status N       the same for the status line
  cancel N       the same for the "Cancel" label
  keyed N/M      of the M colour-key pixels inside the window's visible
                 area, N show the screen behind the window
  pinkish N      pixels of the window near the colour key (a fringe)
Needs Debian's python3-pil.
"""
import sys

from PIL import Image

KEY = (236, 0, 140)
BAR_ORIGIN, BAR_FULL, BAR_ROW = (26, 432), 330, 443


def differs(a, b, threshold=48):
    return sum(abs(x - y) for x, y in zip(a[:3], b[:3])) > threshold


def main(argv):
    screen = Image.open(argv[1]).convert("RGB")
    left, top = int(argv[2]), int(argv[3])
    picture = Image.open(argv[4]).convert("RGB")
    width, height = picture.size
    at = lambda x, y: screen.getpixel((left + x, top + y))

    bar = 0
    for x in range(BAR_ORIGIN[0], BAR_ORIGIN[0] + BAR_FULL + 10):
        if not differs(at(x, BAR_ROW), picture.getpixel((x, BAR_ROW))):
            break
        bar += 1
    print("bar", bar)

    def changed(x0, y0, x1, y1):
        return sum(differs(at(x, y), picture.getpixel((x, y)))
                   for x in range(x0, x1) for y in range(y0, y1))

    print("title", changed(11, 5, 260, 26))
    print("status", changed(22, 408, 322, 428))
    print("cancel", changed(395, 433, 475, 452))

    # The screen behind the window, from a corner the window does not
    # cover.
    behind = screen.getpixel((0, 0))
    keyed = shown = 0
    pinkish = 0
    for y in range(1, height - 1):
        for x in range(1, width - 1):
            pixel = at(x, y)
            if picture.getpixel((x, y)) == KEY:
                keyed += 1
                shown += not differs(pixel, behind, 0)
            if pixel[0] >= 150 and pixel[1] <= 90 and pixel[2] >= 70:
                pinkish += 1
    print(f"keyed {shown}/{keyed}")
    print("pinkish", pinkish)


if __name__ == "__main__":
    main(sys.argv)
