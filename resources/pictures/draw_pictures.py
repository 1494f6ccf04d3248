#!/usr/bin/python3
"""Draws the pictures of the updater's window for Ironvale.

usage: draw_pictures.py [OUTPUT_FOLDER]   (default: this script's folder)

Needs Debian's python3-pil and fonts-dejavu-core. The results are
committed; run this again after changing it and commit the new pictures.

Everything outside the window's outline is the colour key RGB(236, 0, 140),
which the window makes transparent. The outline is drawn without
anti-aliasing: a blended edge pixel would be neither key nor frame and
show as a pink fringe. Nothing inside uses a colour near the key.
"""
import math
import os
import sys

from PIL import Image, ImageDraw, ImageFilter, ImageFont

KEY = (236, 0, 140)
WIDTH, HEIGHT = 532, 481
PICTURE_ORIGIN, PICTURE_SIZE = (14, 38), (504, 356)
BAR_ORIGIN, BAR_LENGTH, BAR_HEIGHT = (26, 432), 330, 23
CANCEL_RECT = (361, 431, 509, 455)
CLOSE_RECT = (504, 4, 527, 27)
CHAMFER = 10

STEEL_LIGHT = (154, 163, 173)
STEEL = (74, 82, 92)
FRAME_TOP = (40, 45, 53)
FRAME_BOTTOM = (24, 27, 32)
TITLE_TOP = (18, 21, 26)
TITLE_BOTTOM = (44, 50, 59)
EMBER = (224, 122, 31)
PARCHMENT = (233, 226, 207)
PARCHMENT_EDGE = (140, 126, 92)
TROUGH = (206, 196, 168)
TROUGH_EDGE = (107, 97, 73)
BUTTON_FACE = (244, 239, 226)
BUTTON_EDGE = (120, 108, 80)

FONT_FOLDER = "/usr/share/fonts/truetype/dejavu"


def mix(a, b, t):
    return tuple(round(x + (y - x) * t) for x, y in zip(a, b))


def vertical_gradient(draw, box, top, bottom):
    left, y0, right, y1 = box
    for y in range(y0, y1 + 1):
        t = (y - y0) / max(1, y1 - y0)
        draw.line([(left, y), (right, y)], fill=mix(top, bottom, t))


def outline(inset):
    """The window's chamfered outline, inset pixels inside the visible area.
    The window cuts off a one-pixel frame, so the visible area is
    x 1..530, y 1..479."""
    l, t, r, b = 1 + inset, 1 + inset, WIDTH - 2 - inset, HEIGHT - 2 - inset
    c = CHAMFER
    return [(l + c, t), (r - c, t), (r, t + c), (r, b - c), (r - c, b), (l + c, b), (l, b - c), (l, t + c)]


def rivet(draw, x, y):
    draw.ellipse([x - 3, y - 3, x + 3, y + 3], fill=STEEL_LIGHT)
    draw.ellipse([x - 2, y - 2, x + 2, y + 2], fill=STEEL)
    draw.point((x - 1, y - 1), fill=(210, 215, 220))


def background():
    image = Image.new("RGB", (WIDTH, HEIGHT), KEY)
    # The frame body: a mask of the outline filled hard (no anti-aliasing),
    # so every pixel is either key or frame.
    body = Image.new("RGB", (WIDTH, HEIGHT))
    body_draw = ImageDraw.Draw(body)
    vertical_gradient(body_draw, (0, 0, WIDTH - 1, HEIGHT - 1), FRAME_TOP, FRAME_BOTTOM)
    vertical_gradient(body_draw, (0, 0, WIDTH - 1, 32), TITLE_TOP, TITLE_BOTTOM)
    mask = Image.new("1", (WIDTH, HEIGHT), 0)
    ImageDraw.Draw(mask).polygon(outline(0), fill=1)
    image.paste(body, (0, 0), mask)

    draw = ImageDraw.Draw(image)
    draw.polygon(outline(0), outline=STEEL_LIGHT)
    draw.polygon(outline(1), outline=STEEL)
    draw.line([(12, 33), (WIDTH - 13, 33)], fill=EMBER)
    draw.line([(12, 34), (WIDTH - 13, 34)], fill=(120, 66, 20))

    # The close spot: an iron plate with a cross.
    x0, y0, x1, y1 = CLOSE_RECT
    draw.rectangle([x0, y0, x1 - 1, y1 - 1], fill=(58, 63, 71), outline=STEEL_LIGHT)
    for offset in range(-1, 2):
        draw.line([(x0 + 6 + offset, y0 + 6), (x1 - 7 + offset, y1 - 7)], fill=(226, 226, 222))
        draw.line([(x1 - 7 + offset, y0 + 6), (x0 + 6 + offset, y1 - 7)], fill=(226, 226, 222))

    # Frame around the picture.
    px, py = PICTURE_ORIGIN
    pw, ph = PICTURE_SIZE
    draw.rectangle([px - 2, py - 2, px + pw + 1, py + ph + 1], outline=STEEL_LIGHT)
    draw.rectangle([px - 1, py - 1, px + pw, py + ph], outline=(12, 14, 17))

    # The light panel under the status line, the bar and the "Cancel" label.
    draw.rectangle([14, 400, 517, 466], fill=PARCHMENT, outline=PARCHMENT_EDGE)
    draw.line([(15, 401), (516, 401)], fill=(250, 246, 236))
    bx, by = BAR_ORIGIN
    draw.rectangle([bx - 2, by - 2, bx + BAR_LENGTH + 1, by + BAR_HEIGHT + 1], fill=TROUGH_EDGE)
    draw.rectangle([bx - 1, by - 1, bx + BAR_LENGTH, by + BAR_HEIGHT], fill=(182, 171, 141))
    draw.rectangle([bx, by, bx + BAR_LENGTH - 1, by + BAR_HEIGHT - 1], fill=TROUGH)
    cx0, cy0, cx1, cy1 = CANCEL_RECT
    draw.rectangle([cx0, cy0, cx1 - 1, cy1 - 1], fill=BUTTON_FACE, outline=BUTTON_EDGE)
    draw.line([(cx0 + 1, cy0 + 1), (cx1 - 2, cy0 + 1)], fill=(255, 255, 250))
    draw.line([(cx0 + 1, cy1 - 2), (cx1 - 2, cy1 - 2)], fill=(214, 205, 182))

    for x, y in [(8, 44), (WIDTH - 9, 44), (8, HEIGHT - 12), (WIDTH - 9, HEIGHT - 12), (8, 250), (WIDTH - 9, 250)]:
        rivet(draw, x, y)
    return image


def default_picture():
    w, h = PICTURE_SIZE
    image = Image.new("RGB", (w, h))
    draw = ImageDraw.Draw(image)
    # Dusk over the valley.
    vertical_gradient(draw, (0, 0, w - 1, 200), (22, 34, 62), (214, 140, 78))
    vertical_gradient(draw, (0, 200, w - 1, h - 1), (60, 64, 58), (28, 30, 28))
    draw.ellipse([300, 150, 360, 210], fill=(250, 214, 150))

    def ridge(base, amplitude, seed, colour):
        points = [(0, h)]
        for x in range(0, w + 8, 8):
            y = base - amplitude * (0.6 * math.sin(x / 53.0 + seed) + 0.4 * math.sin(x / 19.0 + 2 * seed))
            points.append((x, y))
        points.append((w, h))
        draw.polygon(points, fill=colour)

    ridge(190, 60, 0.7, (70, 74, 92))
    ridge(220, 45, 2.1, (48, 52, 64))
    ridge(262, 25, 4.0, (34, 38, 44))
    # The river through the valley floor.
    river = [(180, h), (226, 318), (252, 284), (264, 266), (268, 266), (272, 286), (296, 320), (330, h)]
    draw.polygon(river, fill=(86, 114, 142))
    draw.line([(258, 292), (252, 310)], fill=(168, 194, 212), width=2)
    draw.line([(282, 318), (292, 340)], fill=(168, 194, 212), width=2)
    draw.line([(236, 330), (228, 348)], fill=(150, 178, 200), width=2)

    # The iron keep with its forge glowing.
    keep = (96, 176, 176, 290)
    draw.rectangle(keep, fill=(26, 28, 33))
    for x in range(96, 177, 16):
        draw.rectangle([x, 166, x + 8, 176], fill=(26, 28, 33))
    draw.rectangle([150, 120, 174, 176], fill=(30, 32, 38))
    for x in range(150, 175, 12):
        draw.rectangle([x, 112, x + 6, 120], fill=(30, 32, 38))
    for x, y in [(110, 200), (140, 200), (110, 236), (156, 150), (140, 236)]:
        draw.rectangle([x, y, x + 7, y + 11], fill=(255, 170, 60))
    draw.rectangle([124, 262, 146, 290], fill=(255, 132, 30))
    # Warm light from the forge door, blurred so it has no edge.
    light = Image.new("L", (w, h), 0)
    ImageDraw.Draw(light).ellipse([104, 246, 166, 306], fill=120)
    light = light.filter(ImageFilter.GaussianBlur(14))
    image.paste(Image.new("RGB", (w, h), (255, 140, 40)), (0, 0), light)
    draw = ImageDraw.Draw(image)
    draw.rectangle([124, 262, 146, 290], fill=(255, 150, 40))
    # Smoke from the forge chimney.
    smoke = Image.new("L", (w, h), 0)
    smoke_draw = ImageDraw.Draw(smoke)
    for i in range(7):
        r = 8 + i * 4
        cx, cy = 166 + i * 9, 104 - i * 14
        smoke_draw.ellipse([cx - r, cy - r, cx + r, cy + r], fill=110 - i * 12)
    smoke = smoke.filter(ImageFilter.GaussianBlur(4))
    image.paste(Image.new("RGB", (w, h), (150, 150, 156)), (0, 0), smoke)
    draw = ImageDraw.Draw(image)

    title = ImageFont.truetype(os.path.join(FONT_FOLDER, "DejaVuSerif-Bold.ttf"), 40)
    text = "IRONVALE"
    box = draw.textbbox((0, 0), text, font=title)
    x = (w - (box[2] - box[0])) // 2
    draw.text((x + 2, 26), text, font=title, fill=(10, 10, 12))
    draw.text((x, 24), text, font=title, fill=(236, 226, 204))
    draw.line([(x, 76), (x + box[2] - box[0], 76)], fill=EMBER, width=2)
    return image


def bar_piece(width, edges):
    """A piece of the progress bar: molten iron, bright on top, dark below.
    edges maps a column to a colour that replaces the fill there."""
    image = Image.new("RGB", (width, BAR_HEIGHT))
    draw = ImageDraw.Draw(image)
    for y in range(BAR_HEIGHT):
        t = y / (BAR_HEIGHT - 1)
        colour = mix((255, 216, 120), (240, 138, 28), t / 0.45) if t < 0.45 else mix((240, 138, 28), (150, 62, 10), (t - 0.45) / 0.55)
        draw.line([(0, y), (width - 1, y)], fill=colour)
        for column, edge in edges.items():
            draw.point((column, y), fill=mix(edge, colour, 0.35))
    return image


def main(argv):
    folder = argv[1] if len(argv) > 1 else os.path.dirname(os.path.abspath(__file__))
    pictures = {
        "background.png": background(),
        "default_picture.png": default_picture(),
        "progress_unit.png": bar_piece(2, {}),
        "begin_progress_unit.png": bar_piece(2, {0: (110, 44, 8)}),
        "end_progress_unit.png": bar_piece(5, {3: (255, 236, 180), 4: (110, 44, 8)}),
    }
    for name, image in pictures.items():
        image.save(os.path.join(folder, name), optimize=True)


if __name__ == "__main__":
    main(sys.argv)
