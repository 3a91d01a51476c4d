#!/usr/bin/env python3
"""Gives the pictures of an MP4 movie an edit list: edits.py FROM TO START:END…

START and END are seconds of what FROM shows; TO shows these parts of it, one after the other. FROM has one track, an
edit list of one entry, and its index behind its media data, as FFmpeg writes it."""
import struct
import sys


def box(data, name, start, end):
    """Where a box of a container begins and ends."""
    at = start
    while at + 8 <= end:
        size, kind = struct.unpack_from(">I4s", data, at)
        if kind == name:
            return at, at + size
        at += size
    raise SystemExit(f"edits.py: there is no {name.decode()}")


def main(source, target, *parts):
    with open(source, "rb") as file:
        data = bytearray(file.read())
    path = [(0, len(data))]
    for name in (b"moov", b"trak", b"edts", b"elst"):
        inner = path[-1][0] + 8 if len(path) > 1 else 0
        path.append(box(data, name, inner, path[-1][1]))
    moov, trak = path[1], path[2]
    mvhd = box(data, b"mvhd", moov[0] + 8, moov[1])[0]
    mdia = box(data, b"mdia", trak[0] + 8, trak[1])
    mdhd = box(data, b"mdhd", mdia[0] + 8, mdia[1])[0]
    movie_ticks = struct.unpack_from(">I", data, mvhd + 20)[0]
    media_ticks = struct.unpack_from(">I", data, mdhd + 20)[0]
    elst = path[4]
    begin = struct.unpack_from(">i", data, elst[0] + 20)[0]

    entries = b""
    for part in parts:
        start, end = (float(each) for each in part.split(":"))
        entries += struct.pack(">IiI", round((end - start) * movie_ticks), begin + round(start * media_ticks), 1 << 16)
    made = struct.pack(">I4sII", 16 + len(entries), b"elst", 0, len(parts)) + entries
    grown = len(made) - (elst[1] - elst[0])
    data[elst[0] : elst[1]] = made
    for at, end in path[1:4]:
        struct.pack_into(">I", data, at, end - at + grown)
    with open(target, "wb") as file:
        file.write(data)


main(*sys.argv[1:])
