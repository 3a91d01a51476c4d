"""Twenty exact thumbnails of a long recording: by `clipsa thumbnails`, ffmpegthumbnailer, and one ffmpeg seek each."""

import os
import select
import subprocess
import tempfile
import time

import commands
import report

COUNT = 20
WIDTH, HEIGHT = 135, 76


def first_and_all(command, folder):
    """Seconds until the first picture is there, and until all are; and the processor's seconds."""
    before = os.times()
    start = time.monotonic()
    first = None
    process = subprocess.Popen(command, stdout=subprocess.DEVNULL)
    ended = os.pidfd_open(process.pid)
    while not select.select([ended], [], [], 0.001)[0]:
        if first is None and any(not name.startswith(".") for name in os.listdir(folder)):
            first = time.monotonic() - start
    os.close(ended)
    if process.wait() != 0:
        raise RuntimeError(" ".join(command) + " failed")
    return first or time.monotonic() - start, time.monotonic() - start, commands.processor_since(before)


def one_by_one(command_at, times):
    before = os.times()
    start = time.monotonic()
    first = None
    for index, at in enumerate(times):
        subprocess.run(command_at(index, at), check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        first = first or time.monotonic() - start
    return first, time.monotonic() - start, commands.processor_since(before)


def measure(settings, movie):
    times = [commands.length_of(movie) * index / COUNT for index in range(COUNT)]
    clock = "{:02d}:{:02d}:{:02d}".format
    results = {"clipsa": [], "thumbnailer": [], "ffmpeg": []}
    for turn in range(max(3, settings.rounds // 3) + 1):
        with tempfile.TemporaryDirectory(prefix="clipsa-bench-") as folder:
            ours = os.path.join(folder, "clipsa")
            os.mkdir(ours)
            taken = {
                "clipsa": first_and_all(
                    [settings.program("clipsa"), "thumbnails", movie, "-n", str(COUNT), "-o", ours, "--size",
                     f"{WIDTH}x{HEIGHT}"], ours),
                "thumbnailer": one_by_one(
                    lambda index, at: ["ffmpegthumbnailer", "-i", movie, "-o", f"{folder}/{index}.png", "-c", "png",
                                       "-s", str(WIDTH), "-t", clock(int(at) // 3600, int(at) // 60 % 60, int(at) % 60)],
                    times),
                "ffmpeg": one_by_one(
                    lambda index, at: ["ffmpeg", "-nostdin", "-v", "error", "-ss", f"{at:.3f}", "-i", movie, "-frames:v",
                                       "1", "-vf", f"scale={WIDTH}:{HEIGHT}", f"{folder}/seek-{index}.png"], times),
            }
        if turn > 0:  # the first fills the page cache
            for name, values in taken.items():
                results[name].append(values)
    for name, title in (("thumbnailer", "ffmpegthumbnailer, which shows other moments than it is asked for"),
                        ("ffmpeg", "one exact ffmpeg seek each")):
        report.heading(f"{COUNT} exact thumbnails, Clipsa : {title}: {settings.show(movie)}")
        for column, what in enumerate(("until the first is there", "until all are there", "processor time")):
            report.ratio(what, [each[column] for each in results["clipsa"]], [each[column] for each in results[name]],
                         "s", 2)
