"""Compares Clipsa with mpv; started by ./bench."""

import argparse
import os
import random
import subprocess
import sys
import tempfile

import memory
import mixing
import playing
import report
import seeking
import sharing
import start
import thumbnails
import trimming

KINDS = ("start", "seek", "scrub", "play", "memory", "thumbnails", "trim", "mix", "share")


class Settings:
    def __init__(self, arguments):
        self.rounds = arguments.rounds
        self.top = arguments.top
        self.random = random.Random(arguments.seed)

    def program(self, name):
        return os.path.join(self.top, "build/release/bin", name)

    def movie(self, name):
        return os.path.join(self.top, "build/bench", name)

    def show(self, path):
        return os.path.relpath(path, self.top)


def main():
    parser = argparse.ArgumentParser(prog="./bench", description="Compares Clipsa with mpv, in turn, in one run.")
    parser.add_argument("kinds", nargs="*", metavar="KIND", help=f"what to measure, of: {' '.join(KINDS)} (all)")
    parser.add_argument("--rounds", type=int, default=15, help="how often each program starts (default: 15)")
    parser.add_argument("--seed", type=int, default=1, help="of the random positions (default: 1)")
    parser.add_argument("--movie", help="a movie of yours instead of the made ones, for all but memory")
    parser.add_argument("--top", help=argparse.SUPPRESS)
    arguments = parser.parse_args()
    for kind in arguments.kinds:
        if kind not in KINDS:
            parser.error(f"there is no {kind} to measure; there are {', '.join(KINDS)}")

    settings = Settings(arguments)
    own = [os.path.abspath(arguments.movie)] if arguments.movie else None
    recording = settings.movie("recording-1080p60.mp4")
    version = subprocess.run(["mpv", "--version"], capture_output=True, text=True, check=True).stdout.split()[1]
    print(f"Clipsa : mpv {version}, in turn. A ratio below 1 is Clipsa's favour; {report.load()}.")
    for kind in arguments.kinds or KINDS:
        if kind == "start":
            start.measure(settings, own or [recording, settings.movie("sample.mp4")])
        elif kind == "seek":
            seeking.measure_seeks(settings, (own or [recording])[0])
        elif kind == "scrub":
            seeking.measure_scrubs(settings, (own or [recording])[0])
        elif kind == "play":
            playing.measure(settings, (own or [recording])[0])
        elif kind == "memory":
            memory.measure(settings, settings.movie("hour-4k.mp4"))
        elif kind == "mix":
            mixing.measure(settings, (own or [settings.movie("ten-minutes-two-tracks.mp4")])[0])
        elif kind == "trim":
            trimming.measure(settings, (own or [settings.movie("ten-minutes-1080p60.mp4")])[0])
        elif kind == "share":
            sharing.measure(settings, (own or [recording])[0])
        elif kind == "thumbnails":
            thumbnails.measure(settings, (own or [settings.movie("ten-minutes-1080p60.mp4")])[0])


if __name__ == "__main__":
    # A home of their own: neither sees, or writes to, what belongs to the person who measures.
    with tempfile.TemporaryDirectory(prefix="clipsa-bench-") as home:
        for name, folder in (("HOME", ""), ("XDG_RUNTIME_DIR", "/runtime"), ("XDG_CACHE_HOME", "/.cache"),
                             ("XDG_CONFIG_HOME", "/.config"), ("XDG_DATA_HOME", "/.local/share")):
            os.makedirs(home + folder, mode=0o700, exist_ok=True)
            os.environ[name] = home + folder
        for name in ("WAYLAND_DISPLAY", "DISPLAY"):
            os.environ.pop(name, None)
        sys.exit(main())
