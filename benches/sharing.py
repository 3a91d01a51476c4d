"""From the tap on Share to a sheet on the screen, where every service is slow and the catalogue is large."""

import gzip
import os
import statistics
import subprocess
import sys
import tempfile
import time

import display
import programs
import report

COMPONENTS = 3000
APP = "org.example.App1500"
AIM = 100  # milliseconds, of the first time
SCRIPT = """
wait picture
wait ready
wait thumbnails
mark tap
tap BAR_SHARE
wait sheet
mark up
tap SHARE_CLOSE
wait editor
wait still
mark tap
tap BAR_SHARE
wait sheet
mark up
tap SHARE_CLOSE
wait editor
tap BAR_DONE
"""


def write_catalogue(path):
    """As Flatpak keeps those of its remotes."""
    folder = os.path.join(path, "flatpak/appstream/flathub/x86_64/active")
    os.makedirs(folder)
    with gzip.open(os.path.join(folder, "appstream.xml.gz"), "wt", encoding="utf-8") as file:
        file.write('<?xml version="1.0" encoding="UTF-8"?>\n<components version="0.14" origin="flathub">\n')
        for number in range(COMPONENTS):
            file.write(f'<component type="desktop-application"><id>org.example.App{number}</id><name>App {number}</name>'
                       f"<summary>Does what {number} does</summary><developer_name>Maker {number}</developer_name>"
                       f"<description><p>{'It is good at many things. ' * 20}</p></description>"
                       f"<categories><category>Utility</category></categories>"
                       f'<bundle type="flatpak">app/org.example.App{number}/x86_64/stable</bundle></component>\n')
        file.write("</components>\n")


class SlowDesktop:
    """A bus on which services are there, and do not answer."""

    def __init__(self, settings, folder):
        tests = os.path.join(settings.top, "tests/linux")
        self.address = f"unix:path={folder}/bus"
        environment = {**os.environ, "DBUS_SESSION_BUS_ADDRESS": self.address}
        self._programs = []
        for command in (
                ["dbus-daemon", "--session", "--nofork", "--nopidfile", "--print-address=1",
                 f"--address={self.address}"],
                ["/usr/bin/python3", "-B", f"{tests}/portals/portal.py", folder, "mute", "Email=4", "OpenURI=4"],
                ["/usr/bin/python3", "-B", f"{tests}/devices/kdeconnect.py", self.address,
                 '{"devices": {}, "holds": "devices"}']):
            program = subprocess.Popen(command, env=environment, stdin=subprocess.DEVNULL if "devices" not in command[-2]
                                       else subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, text=True)
            program.stdout.readline()
            self._programs.append(program)

    def close(self):
        for program in reversed(self._programs):
            programs.end(program)


class Run:
    """Milliseconds of the first and of the second sheet: until something of it can be seen, until it is all there."""

    def __init__(self, settings, movie, screen, colour):
        screen.wait_until_empty()
        with tempfile.TemporaryDirectory(prefix="clipsa-bench-") as folder:
            desktop = SlowDesktop(settings, folder)
            script = os.path.join(folder, "script")
            with open(script, "w", encoding="utf-8") as file:
                file.write(SCRIPT)
            data = os.path.join(folder, "data")
            write_catalogue(data)
            window = programs.Window(
                [settings.program("clipsa"), "open", movie, "--device", "pad", "--bundle-id", APP], screen,
                CLIPSA_TRACE_START="1", CLIPSA_SCRIPT=script, DBUS_SESSION_BUS_ADDRESS=desktop.address,
                XDG_DATA_HOME=data, XDG_CACHE_HOME=os.path.join(folder, "cache"))
            self._dimmed = []
            try:
                screen.wait_for(colour, 20)
                self._watch(window, screen)
            finally:
                said = window.close()
                desktop.close()
        marks = [(line.split()[0], int(line.split()[1])) for line in said.splitlines()
                 if line.startswith(("tap ", "up "))]
        taps = [at for name, at in marks if name == "tap"]
        ups = [at for name, at in marks if name == "up"]
        if len(taps) != 2 or len(ups) != 2 or len(self._dimmed) != 2:
            sys.exit(f"the sheet did not come twice: {marks}, {self._dimmed}\n{said}")
        self.seen = [(dimmed - tap) / 1e6 for dimmed, tap in zip(self._dimmed, taps)]
        self.up = [(up - tap) / 1e6 for up, tap in zip(ups, taps)]

    def _watch(self, window, screen):
        """Notes when the movie is dimmed, until the program has ended."""
        bright, is_dimmed = screen.colour(), False
        end = time.monotonic() + 60
        while window.is_running() and time.monotonic() < end:
            now = screen.colour()
            darker = sum(bright) - sum(now)
            if not is_dimmed and 6 < darker < sum(bright):
                self._dimmed.append(time.monotonic_ns())
                is_dimmed = True
            elif is_dimmed and darker <= 2:
                is_dimmed = False
            time.sleep(0.001)


def measure(settings, movie):
    screen = display.Screen()
    try:
        colour = display.colour_of(movie)
        runs = [Run(settings, movie, screen, colour) for _ in range(max(3, settings.rounds // 3) + 1)][1:]
    finally:
        screen.close()
    report.heading(f"From the tap on Share, {COMPONENTS} applications in the catalogue, services that do not answer")
    report.ratio("a sheet comes, first : second time", [run.seen[0] for run in runs], [run.seen[1] for run in runs],
                 "ms")
    report.ratio("all of it is there, the same", [run.up[0] for run in runs], [run.up[1] for run in runs], "ms")
    first = statistics.median(run.seen[0] for run in runs)
    report.note(f"the aim for the first is {AIM} ms: {'met' if first <= AIM else 'missed'}")
