#!/usr/bin/env python3
"""Writes H.264 into Matroska as browsers record it: recorded.py FROM TO WIDTH HEIGHT

The file's header has no parameter sets, only the first packet has them; lengths are unknown, and there is no table.
FROM has start codes, and delimiters between its pictures, 30 a second in the order of presentation."""
import re
import sys


def element(name, payload):
    return bytes.fromhex(name) + (len(payload) | 1 << 56).to_bytes(8, "big") + payload


def number(name, value):
    return element(name, value.to_bytes(8, "big").lstrip(b"\0") or b"\0")


def endless(name):
    return bytes.fromhex(name) + b"\x01" + b"\xff" * 7


def pictures(data):
    units = [unit for unit in re.split(b"\0\0\0?\1", data) if unit]
    seen_sets = False
    picture = []
    for unit in units + [b"\x09"]:
        kind = unit[0] & 31
        if kind == 9:
            if picture:
                yield picture
                seen_sets = True
            picture = []
        elif kind not in (6, 7, 8) or (kind != 6 and not seen_sets):
            picture.append(unit)


def main(source, target, width, height):
    with open(source, "rb") as file:
        data = file.read()
    video = element("e0", number("b0", int(width)) + number("ba", int(height)))
    track = number("d7", 1) + number("73c5", 1) + number("83", 1) + element("86", b"V_MPEG4/ISO/AVC") + video
    with open(target, "wb") as file:
        file.write(element("1a45dfa3", element("4282", b"matroska") + number("4287", 4) + number("4285", 2)))
        file.write(endless("18538067"))
        file.write(element("1549a966", number("2ad7b1", 1000000) + element("4d80", b"made") + element("5741", b"made")))
        file.write(element("1654ae6b", element("ae", track)))
        cluster = 0
        for count, picture in enumerate(pictures(data)):
            time = round(count * 1000 / 30)
            if count % 60 == 0:
                cluster = time
                file.write(endless("1f43b675") + number("e7", cluster))
            is_key = any(unit[0] & 31 == 5 for unit in picture)
            head = b"\x81" + (time - cluster).to_bytes(2, "big") + (b"\x80" if is_key else b"\0")
            file.write(element("a3", head + b"".join(b"\0\0\0\1" + unit for unit in picture)))


main(*sys.argv[1:])
