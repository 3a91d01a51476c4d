"""A part of a ten-minute recording: by `clipsa trim`, by copying packets, and by encoding everything."""

import os
import statistics
import subprocess
import tempfile

import commands
import report

ENCODED_SECONDS = 60  # of the movie; encoding all of it would take longer than everything else together


def keyframes_of(movie):
    lines = subprocess.run(
        ["ffprobe", "-v", "error", "-select_streams", "v", "-show_entries", "packet=pts_time,flags", "-of",
         "csv=nokey=1:p=0", movie], check=True, capture_output=True, text=True).stdout.split()
    return sorted(float(line.split(",")[0]) for line in lines if "K" in line.split(",")[1])


def timed(command, output):
    """As commands.timed; the program writes `output` anew."""
    if os.path.exists(output):
        os.remove(output)
    return commands.timed(command)


def measure(settings, movie):
    keyframes = keyframes_of(movie)
    length = commands.length_of(movie)
    at_keyframe = keyframes[1]
    step = keyframes[2] - keyframes[1]
    # From one picture behind a keyframe a whole group but that picture is encoded again.
    starts = {"from a keyframe": at_keyframe, "from the middle of a group": at_keyframe + step / 2,
              "from behind a keyframe": at_keyframe + 0.02}
    report.heading(f"Trimming to the end, Clipsa : ffmpeg -c copy: {settings.show(movie)}, keyframes {step:.1f} s apart")
    rounds = max(3, settings.rounds // 3)
    with tempfile.TemporaryDirectory(prefix="clipsa-bench-", dir=os.path.dirname(movie)) as folder:
        output = os.path.join(folder, "out.mp4")
        encoded = timed(["ffmpeg", "-v", "error", "-ss", str(at_keyframe), "-t", str(ENCODED_SECONDS), "-i", movie,
                         "-c:v", "libx264", "-crf", "17", "-c:a", "copy", output], output)[0]
        encoding = encoded / ENCODED_SECONDS * (length - at_keyframe)
        for name, start in starts.items():
            ours, copies = [], []
            for turn in range(rounds + 1):
                ours.append(timed([settings.program("clipsa"), "trim", movie, "--from", f"{start:.6f}", "-o", output],
                                  output))
                copies.append(timed(["ffmpeg", "-v", "error", "-ss", f"{start:.6f}", "-i", movie, "-map", "0", "-c",
                                     "copy", output], output))
            # The first turn fills the page cache.
            for column, what in enumerate((name, "  processor time")):
                report.ratio(what, [each[column] for each in ours[1:]], [each[column] for each in copies[1:]], "s", 2)
            ratio = encoding / statistics.median(each[0] for each in ours[1:])
            report.note(f"{ratio:.0f} times faster than ffmpeg encoding at crf 17, {encoding:.0f} s"
                        f" (reckoned from {ENCODED_SECONDS} s of it, which took {encoded:.1f} s)")
