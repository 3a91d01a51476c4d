"""From the start of the process to the movie's first picture on the screen."""

import statistics
import time

import display
import programs
import report

MARKS = ("main", "application", "platform", "connected", "payload", "window", "first-picture")


class Run:
    """One start of one program."""

    def __init__(self, command, screen, colour, **environment):
        screen.wait_until_empty()
        self.editor_started = None
        window = programs.Window(command, screen, **environment)

        def look_for_editor():
            if self.editor_started is None and programs.children(window.pid):
                self.editor_started = time.monotonic_ns()

        try:
            seen = screen.wait_for(colour, 20, meanwhile=look_for_editor)
            self.wall = (seen - window.started) / 1e6
            self.processor = sum(programs.processor_seconds(pid) for pid in window.processes()) * 1e3
            self.editor = (seen - self.editor_started) / 1e6 if self.editor_started else None
            time.sleep(0.1)  # for the marks that are written behind the picture
        finally:
            said = window.close()
        words = [line.split() for line in said.splitlines()]
        self.marks = {word[0]: (int(word[1]) - window.started) / 1e6 for word in words
                      if len(word) == 2 and word[0] in MARKS}


def measure(settings, movies):
    screen = display.Screen()
    try:
        for movie in movies:
            measure_movie(settings, screen, movie)
    finally:
        screen.close()


def measure_movie(settings, screen, movie):
    colour = display.colour_of(movie)
    ours = [settings.program("clipsa"), "open", movie]
    theirs = [*programs.MPV, "--ao=null", f"--geometry={display.SIZE[0]}x{display.SIZE[1]}+0+0"]
    ways = {
        "clipsa": (ours, {}),
        "clipsa software": (ours, {"QT_QUICK_BACKEND": "software"}),
        "clipsa OpenGL": (ours, {"QSG_RHI_BACKEND": "opengl"}),
        "mpv x11": ([*theirs, "--vo=x11", movie], {}),
        "mpv gpu": ([*theirs, "--vo=gpu", "--gpu-sw=yes", movie], {}),
    }
    runs = {name: [] for name in ways}
    for turn in range(settings.rounds + 1):
        for name, (command, environment) in ways.items():
            run = Run(command, screen, colour, CLIPSA_TRACE_START="1", **environment)
            if turn > 0:  # the first fills the page cache, and what programs keep in files
                runs[name].append(run)

    report.heading(f"Start-up, to the first picture on the screen: {settings.show(movie)}")

    def compare(name, first, second, of, unit="ms"):
        report.ratio(name, [of(run) for run in runs[first]], [of(run) for run in runs[second]], unit)

    faster = min(("mpv x11", "mpv gpu"), key=lambda name: statistics.median(run.wall for run in runs[name]))
    compare(f"clipsa open : {faster} (its best)", "clipsa", faster, lambda run: run.wall)
    compare("the same, processor time", "clipsa", faster, lambda run: run.processor)
    compare("software drawing : mpv x11", "clipsa software", "mpv x11", lambda run: run.wall)
    compare("the same, processor time", "clipsa software", "mpv x11", lambda run: run.processor)
    compare("OpenGL (llvmpipe) : mpv gpu", "clipsa OpenGL", "mpv gpu", lambda run: run.wall)
    compare("the same, processor time", "clipsa OpenGL", "mpv gpu", lambda run: run.processor)
    report.ratio("clipsa-editor alone : " + faster, [run.editor for run in runs["clipsa"]],
                 [run.wall for run in runs[faster]], "ms")
    for name in ("clipsa software", "clipsa OpenGL"):
        report.note(f"where it goes, {name}: " + stages(runs[name]))


def stages(runs):
    """Each mark as a share of the whole, from medians."""
    whole = statistics.median(run.wall for run in runs)
    parts, last = [], 0.0
    for mark in MARKS:
        at = statistics.median(run.marks[mark] for run in runs)
        parts.append(f"{mark} {(at - last) / whole:.0%}")
        last = at
    return ", ".join(parts)
