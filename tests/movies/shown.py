#!/usr/bin/env python3
"""Lets an MP4 movie show less of its pictures than they have, at the right and at the bottom: shown.py FROM TO WIDTH HEIGHT

Only what the file says of their size is changed. FROM has one track, of H.264."""
import struct
import sys


def main(source, target, width, height):
    with open(source, "rb") as file:
        data = bytearray(file.read())
    entry = data.index(b"avc1", data.index(b"stsd")) + 28
    was = struct.unpack_from(">HH", data, entry)
    struct.pack_into(">HH", data, entry, int(width), int(height))
    track = data.index(struct.pack(">II", was[0] << 16, was[1] << 16), data.index(b"tkhd"))
    struct.pack_into(">II", data, track, int(width) << 16, int(height) << 16)
    with open(target, "wb") as file:
        file.write(data)


main(*sys.argv[1:])
