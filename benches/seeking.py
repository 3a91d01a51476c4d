"""How soon a picture is there: at random places, and under a finger that moves."""

import subprocess

import programs
import report

SEEKS = 30
SCRUBBED = 10.0  # seconds
STEPS = 100      # at sixty steps a second a finger takes 1.7 s for it
THEIR_STEP = 4   # mpv keeps no pictures: each step costs it what any exact seek does, and a part of them tells as much


def picture_times(movie):
    """When each picture is shown, in seconds from the movie's start."""
    lines = subprocess.run(
        ["ffprobe", "-v", "error", "-select_streams", "v:0", "-show_entries", "packet=pts_time", "-of",
         "default=nokey=1:noprint_wrappers=1", movie], check=True, capture_output=True, text=True).stdout.split()
    return sorted(float(line) for line in lines if line != "N/A")


def just_behind(time):
    """Asked for exactly, a picture's time can be rounded to the picture before it."""
    return round(time + 0.0005, 6)


def measure_seeks(settings, movie):
    times = picture_times(movie)[:-1]
    places = [just_behind(settings.random.choice(times)) for _ in range(SEEKS)]
    player = programs.Player(settings.program("clipsa-bench-player"), movie)
    mpv = programs.Mpv(movie)
    ours, theirs = [], []
    processor = {player: 0.0, mpv: 0.0}
    try:
        for place in places:
            for program, results in ((player, ours), (mpv, theirs)):
                before = programs.processor_seconds(program.pid)
                results.append(program.seek(place))
                processor[program] += programs.processor_seconds(program.pid) - before
    finally:
        player.close()
        mpv.close()
    report.heading(f"Exact seeks to random pictures, paused: {settings.show(movie)}")
    report.ratio("until the picture is there", ours, theirs, "ms", 1)
    report.ratio("processor time of all of them", [processor[player]], [processor[mpv]], "s", 2)


def share_of_late(values):
    return f"{sum(value > 16 for value in values) / len(values):.0%}"


def measure_scrubs(settings, movie):
    times = picture_times(movie)
    middle = min(20.0, max(0.0, (times[-1] - SCRUBBED) / 2))
    targets = [min(times, key=lambda time, at=middle + SCRUBBED * i / STEPS: abs(time - at)) for i in range(STEPS + 1)]
    there = [just_behind(time) for time in targets]
    report.heading(f"Scrubbing {SCRUBBED:.0f} s in {STEPS} steps, each waits for its picture: {settings.show(movie)}")
    for name, path in (("forward", there), ("backward", there[::-1])):
        player = programs.Player(settings.program("clipsa-bench-player"), movie)
        mpv = programs.Mpv(movie)
        try:
            for turn in ("the first time", "again, the same way"):
                ours, theirs = [], []
                # A stretch each in turn: as near in time as can be, and each as undisturbed as under a finger.
                for start in range(0, len(path), 20):
                    stretch = path[start:start + 20]
                    ours += [player.scrub(place) for place in stretch]
                    theirs += [mpv.seek(place) for place in stretch[::THEIR_STEP]]
                report.ratio(f"{name}, {turn}", ours, theirs, "ms", 1)
                report.note("later than 16 ms: " + " : ".join(share_of_late(each) for each in (ours, theirs)))
                if turn == "the first time":
                    player.scrub(path[0])
                    mpv.seek(path[0])
        finally:
            player.close()
            mpv.close()
