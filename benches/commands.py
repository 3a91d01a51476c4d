"""Commands that make a file and end: what each takes, and how long the movie is that it is given."""

import os
import subprocess
import time


def length_of(movie):
    """In seconds."""
    return float(subprocess.run(
        ["ffprobe", "-v", "error", "-show_entries", "format=duration", "-of", "default=nokey=1:noprint_wrappers=1",
         movie], check=True, capture_output=True, text=True).stdout)


def processor_since(before):
    """Seconds of the processor that children took which have ended since `before`, a value of os.times()."""
    now = os.times()
    return now.children_user + now.children_system - before.children_user - before.children_system


def timed(command):
    """Seconds on the clock, and the processor's."""
    before = os.times()
    start = time.monotonic()
    subprocess.run(command, check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL)
    return time.monotonic() - start, processor_since(before)
