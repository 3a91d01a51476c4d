#!/usr/bin/env python3
"""Paints the pictures of the test movies: raw yuv420p frames on standard output.

paint.py clock WIDTH HEIGHT FRAMES [--fps F] [--first N] [--full] [--irregular]
paint.py bars  WIDTH HEIGHT FRAMES --matrix bt709|bt601 [--full]

README.md beside this file says what the pictures encode.
"""
import argparse
import sys

DIGITS = {  # 3 columns, 5 rows, one octal digit a row
    "0": "75557", "1": "26227", "2": "71747", "3": "71717", "4": "55711",
    "5": "74717", "6": "74757", "7": "71111", "8": "75757", "9": "75717", ".": "00002", " ": "00000",
}
BARS = [(255, 0, 0), (0, 255, 0), (0, 0, 255), (255, 255, 255), (128, 128, 128), (0, 0, 0)]
KR_KB = {"bt709": (0.2126, 0.0722), "bt601": (0.299, 0.114)}


def irregular_milliseconds(n):
    """The time of frame n of vfr.mkv. make-test-movies writes the same formula for FFmpeg."""
    return 33 * n + n * 7 % 11 * 2 + 400 * (n // 20)


class Picture:
    def __init__(self, width, height, luma):
        self.width, self.height = width, height
        self.y = bytearray([luma]) * (width * height)
        self.u = bytearray([128]) * (width * height // 4)
        self.v = bytearray([128]) * (width * height // 4)

    def fill(self, x, y, width, height, luma):
        row = bytes([luma]) * width
        for at in range(y * self.width + x, (y + height) * self.width + x, self.width):
            self.y[at:at + width] = row

    def fill_colour(self, x, y, width, height, colour):
        self.fill(x, y, width, height, colour[0])
        for plane, value in ((self.u, colour[1]), (self.v, colour[2])):
            for row in range(y // 2, (y + height) // 2):
                at = row * (self.width // 2) + x // 2
                plane[at:at + width // 2] = bytes([value]) * (width // 2)

    def text(self, x, y, text, size, luma):
        for place, letter in enumerate(text):
            for row, bits in enumerate(DIGITS[letter]):
                for column in range(3):
                    if int(bits) >> (2 - column) & 1:
                        self.fill(x + (place * 4 + column) * size, y + row * size, size, size, luma)

    def write(self):
        sys.stdout.buffer.write(self.y)
        sys.stdout.buffer.write(self.u)
        sys.stdout.buffer.write(self.v)


def clock(options):
    width, height = options.width, options.height
    black, white = (0, 255) if options.full else (16, 235)
    a_row = 16 if width >= 640 else 8
    base = Picture(width, height, 70)
    top = 8 + 38 * (16 // a_row)  # below the squares
    for strip in range(8):  # a quiet background with some colour
        x = strip * width // 8 // 2 * 2
        base.fill_colour(x, top, (strip + 1) * width // 8 // 2 * 2 - x, height - top,
                         (60 + 8 * strip, 150 - 6 * strip, 110 + 5 * strip))
    size = width // 64 * 2 or 2
    for index in range(options.frames):
        n = options.first + index
        number = irregular_milliseconds(n) if options.irregular else n
        seconds = number / 1000 if options.irregular else n / options.fps
        picture = Picture(width, height, 0)
        picture.y[:], picture.u[:], picture.v[:] = base.y, base.u, base.v
        for bit in range(16):
            picture.fill(8 + bit % a_row * 38, 8 + bit // a_row * 38, 32, 32, white if number >> bit & 1 else black)
        picture.fill(number * 4 % (width - 16), height - 40, 16, 32, white)
        picture.text(width // 16, height // 2 - 5 * size // 2, f"{seconds:6.3f}", size, white)
        picture.write()


def bars(options):
    picture = Picture(options.width, options.height, 16)
    kr, kb = KR_KB[options.matrix]
    for place, (r, g, b) in enumerate(BARS):
        luma = (kr * r + (1 - kr - kb) * g + kb * b) / 255
        cb, cr = (b / 255 - luma) / 2 / (1 - kb), (r / 255 - luma) / 2 / (1 - kr)
        colour = (255 * luma, 128 + 255 * cb, 128 + 255 * cr) if options.full \
            else (16 + 219 * luma, 128 + 224 * cb, 128 + 224 * cr)
        width, height = options.width // 3 // 2 * 2, options.height // 2
        picture.fill_colour(place % 3 * width, place // 3 * height, width, height,
                            [min(255, int(value + 0.5)) for value in colour])
    for _ in range(options.frames):
        picture.write()


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("kind", choices=["clock", "bars"])
    for name in ("width", "height", "frames"):
        parser.add_argument(name, type=int)
    parser.add_argument("--fps", type=int, default=30)
    parser.add_argument("--first", type=int, default=0)
    parser.add_argument("--full", action="store_true")
    parser.add_argument("--irregular", action="store_true")
    parser.add_argument("--matrix", choices=list(KR_KB))
    options = parser.parse_args()
    {"clock": clock, "bars": bars}[options.kind](options)


if __name__ == "__main__":
    main()
