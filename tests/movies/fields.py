#!/usr/bin/env python3
"""Writes H.264 whose pictures are coded as two fields each, which no encoder at hand does: IVF on standard output.

fields.py FRAMES GROUP [--apart]

The pictures are 320x96, with the squares of README.md; a group of pictures has GROUP of them. What changes from one
picture to the next is stored as it is, the rest is taken from the last field of the same parity. A packet holds both
fields of a picture; one of them with --apart.
"""
import struct
import sys

WIDTH, HEIGHT = 320, 96
COLUMNS, ROWS = WIDTH // 16, HEIGHT // 32  # macroblocks of a field
BLACK, GREY, WHITE = 16, 70, 235


class Bits:
    def __init__(self):
        self.bytes, self.rest, self.count = bytearray(), 0, 0

    def u(self, count, value):
        for place in range(count - 1, -1, -1):
            self.rest = self.rest << 1 | value >> place & 1
            self.count += 1
            if self.count == 8:
                self.bytes.append(self.rest)
                self.rest = self.count = 0

    def ue(self, value):
        length = (value + 1).bit_length()
        self.u(2 * length - 1, value + 1)

    def align(self):
        while self.count:
            self.u(1, 0)

    def end(self):
        self.u(1, 1)
        self.align()
        return bytes(self.bytes)


def unit(header, bits):
    out, zeros = bytearray([0, 0, 0, 1, header]), 0
    for byte in bits.end():
        if zeros >= 2 and byte <= 3:
            out.append(3)
            zeros = 0
        out.append(byte)
        zeros = zeros + 1 if byte == 0 else 0
    return bytes(out)


def sequence_set():
    bits = Bits()
    bits.u(8, 77)  # Main
    bits.u(8, 0)
    bits.u(8, 30)
    bits.ue(0)
    bits.ue(0)  # 4 bits of frame_num
    bits.ue(0)
    bits.ue(4)  # 8 bits of the order
    bits.ue(2)  # reference frames
    bits.u(1, 0)
    bits.ue(COLUMNS - 1)
    bits.ue(ROWS - 1)
    bits.u(1, 0)  # fields
    bits.u(1, 0)  # whole pictures of them
    bits.u(1, 1)
    bits.u(1, 0)
    bits.u(1, 1)  # usability: BT.709, limited; 30 frames a second; nothing reordered
    bits.u(1, 0)
    bits.u(1, 0)
    bits.u(1, 1)
    bits.u(3, 5)
    bits.u(1, 0)
    bits.u(1, 1)
    bits.u(24, 0x010101)
    bits.u(1, 0)
    bits.u(1, 1)
    bits.u(32, 1)
    bits.u(32, 60)
    bits.u(1, 1)
    bits.u(3, 0)
    bits.u(1, 1)
    bits.u(1, 1)
    for value in (2, 1, 16, 16, 0, 2):
        bits.ue(value)
    return bits


def picture_set():
    bits = Bits()
    bits.ue(0)
    bits.ue(0)
    bits.u(2, 0)
    for _ in range(3):
        bits.ue(0)
    bits.u(3, 0)
    for _ in range(3):
        bits.ue(0)
    bits.u(3, 0b100)  # slices say how edges are filtered
    return bits


def luma_of(number):
    """The rows of a picture."""
    rows = [bytearray([GREY]) * WIDTH for _ in range(HEIGHT)]
    for square in range(16):
        x, y = 8 + square % 8 * 38, 8 + square // 8 * 38
        for row in rows[y:y + 32]:
            row[x:x + 32] = bytes([WHITE if number >> square & 1 else BLACK]) * 32
    return rows


def macroblock(rows, parity, place):
    x, y = place % COLUMNS * 16, place // COLUMNS * 16
    field = rows[parity::2]
    return b"".join(field[line][x:x + 16] for line in range(y, y + 16)) + bytes([128]) * 128


def field(number, group, parity, last, rows):
    in_group = number % group
    is_idr = in_group == 0 and parity == 0
    is_intra = in_group == 0
    bits = Bits()
    bits.ue(0)
    bits.ue(7 if is_intra else 5)
    bits.ue(0)
    bits.u(4, in_group % 16)
    bits.u(1, 1)
    bits.u(1, parity)
    if is_idr:
        bits.ue(number // group % 2)
    bits.u(8, (2 * in_group + parity) % 256)
    if not is_intra:
        bits.u(2, 0)
    bits.u(2 if is_idr else 1, 0)
    bits.ue(0)  # the quantiser stays
    bits.ue(1)  # no edge is filtered
    skipped = 0
    for place in range(COLUMNS * ROWS):
        block = macroblock(rows, parity, place)
        if not is_intra:
            if block == macroblock(last, parity, place):
                skipped += 1
                continue
            bits.ue(skipped)
            skipped = 0
        bits.ue(25 if is_intra else 30)
        bits.align()
        bits.bytes += block
    if skipped:
        bits.ue(skipped)
    return unit(0x65 if is_idr else 0x61, bits)


def packet(time, data):
    sys.stdout.buffer.write(struct.pack("<IQ", len(data), time) + data)


def main():
    frames, group = int(sys.argv[1]), int(sys.argv[2])
    is_apart = "--apart" in sys.argv
    sys.stdout.buffer.write(struct.pack("<4sHH4sHHIIII", b"DKIF", 0, 32, b"H264", WIDTH, HEIGHT, 60, 1,
                                        frames * (1 + is_apart), 0))
    last = None
    for number in range(frames):
        sets = unit(0x67, sequence_set()) + unit(0x68, picture_set()) if number % group == 0 else b""
        rows = luma_of(number)
        top, bottom = (field(number, group, parity, last, rows) for parity in (0, 1))
        if is_apart:
            packet(2 * number, sets + top)
            packet(2 * number + 1, bottom)
        else:
            packet(2 * number, sets + top + bottom)
        last = rows


if __name__ == "__main__":
    main()
