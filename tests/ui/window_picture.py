#!/usr/bin/python3
"""window_picture.py LEFT TOP LENGTH BACKGROUND FAILED_PNG: waits up to ten seconds for the window at LEFT TOP on
$DISPLAY to show its bar LENGTH px long, title, status and "Cancel" drawn, and the screen behind every colour-key
pixel with no pink fringe; else saves the screen as FAILED_PNG and exits 1."""
import os
import sys
import time

from PIL import Image, ImageGrab

KEY = (236, 0, 140)
BAR_LEFT, BAR_ROW = 26, 443


def differs(a, b):
    return sum(abs(x - y) for x, y in zip(a, b)) > 48


def measure(screen, left, top, picture):
    shown, drawn = screen.load(), picture.load()
    at = lambda x, y: shown[left + x, top + y]
    changed = lambda x0, y0, x1, y1: sum(differs(at(x, y), drawn[x, y]) for x in range(x0, x1) for y in range(y0, y1))
    bar = next((x for x in range(BAR_LEFT, BAR_LEFT + 340) if not differs(at(x, BAR_ROW), drawn[x, BAR_ROW])), 999)
    # The window's region leaves out its outermost pixels; the screen's
    # corner is never covered by it.
    inside = [(x, y) for y in range(1, picture.height - 1) for x in range(1, picture.width - 1)]
    keyed = [at(x, y) for x, y in inside if drawn[x, y] == KEY]
    return {"bar": bar - BAR_LEFT, "title": changed(11, 5, 260, 26), "status": changed(22, 408, 322, 428),
            "cancel": changed(395, 433, 475, 452), "keyed": len(keyed),
            "keyed_opaque": sum(pixel != shown[0, 0] for pixel in keyed),
            "pinkish": sum(r >= 150 and g <= 90 and b >= 70 for r, g, b in (at(x, y) for x, y in inside))}


def main(left, top, length, background, failed):
    picture = Image.open(background).convert("RGB")
    for _ in range(40):
        screen = ImageGrab.grab(xdisplay=os.environ["DISPLAY"]).convert("RGB")
        seen = measure(screen, int(left), int(top), picture)
        good = (seen["bar"] == int(length) and seen["title"] > 100 and seen["status"] > 100 and seen["cancel"] > 50
                and seen["keyed"] > 0 and seen["keyed_opaque"] == 0 and seen["pinkish"] == 0)
        if good:
            break
        time.sleep(0.25)
    else:
        screen.save(failed)
    print(seen)
    return 0 if good else 1


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
