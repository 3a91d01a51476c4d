"""Mixing the two sound tracks of a ten-minute recording into one: by `clipsa mix`, and by ffmpeg's amix."""

import os
import tempfile

import commands
import report


def measure(settings, movie):
    ours = []
    theirs = []
    for turn in range(max(3, settings.rounds // 3) + 1):
        with tempfile.TemporaryDirectory(prefix="clipsa-bench-") as folder:
            taken = commands.timed(
                [settings.program("clipsa"), "mix", movie, "-o", os.path.join(folder, "clipsa.mp4")])
            peers = commands.timed(
                ["ffmpeg", "-nostdin", "-v", "error", "-i", movie, "-filter_complex",
                 "[0:a:0][0:a:1]amix=normalize=0[mix]", "-map", "0:v", "-map", "[mix]", "-c:v", "copy", "-c:a", "aac",
                 "-b:a", "256k", os.path.join(folder, "ffmpeg.mp4")])
        if turn > 0:  # the first fills the page cache
            ours.append(taken)
            theirs.append(peers)
    report.heading(f"Mixing two sound tracks, pictures copied, Clipsa : ffmpeg: {settings.show(movie)}")
    for column, what in enumerate(("until the movie is there", "processor time")):
        report.ratio(what, [each[column] for each in ours], [each[column] for each in theirs], "s", 2)
