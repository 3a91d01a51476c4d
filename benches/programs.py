"""The two programs that are compared: how each is started, asked and ended."""

import json
import os
import signal
import socket
import subprocess
import tempfile
import time

MPV = ["mpv", "--no-config", "--no-terminal", "--pause"]


def processor_seconds(pid):
    """User and system time of a process so far, its ended threads included."""
    return time.clock_gettime((~pid << 3) | 2)  # clock_getcpuclockid(3)


def children(pid):
    try:
        with open(f"/proc/{pid}/task/{pid}/children") as file:
            return [int(child) for child in file.read().split()]
    except OSError:
        return []


def memory_peak(pid):
    """The most memory that a process has had, in MiB; and how much of it no other process could share."""
    values = {}
    with open(f"/proc/{pid}/status") as file:
        for line in file:
            name, _, value = line.partition(":")
            if name in ("VmHWM", "RssAnon"):
                values[name] = int(value.split()[0]) / 1024
    return values["VmHWM"], values["RssAnon"]


def end(process):
    """Asks, then makes, a process end."""
    if process.poll() is None:
        process.send_signal(signal.SIGTERM)
        try:
            process.wait(5)
        except subprocess.TimeoutExpired:
            process.kill()
    process.wait()


class Mpv:
    """mpv without a window, asked through its socket."""

    name = "mpv"

    def __init__(self, movie, *options):
        self._directory = tempfile.TemporaryDirectory(prefix="clipsa-bench-")
        path = self._directory.name + "/mpv"
        self._process = subprocess.Popen(
            [*MPV, "--vo=null", "--ao=null", "--hr-seek=yes", f"--input-ipc-server={path}", *options, movie],
            stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        self._socket = socket.socket(socket.AF_UNIX)
        end_of_patience = time.monotonic() + 10
        while True:
            try:
                self._socket.connect(path)
                break
            except OSError:
                if time.monotonic() > end_of_patience:
                    raise
                time.sleep(0.005)
        self._lines = self._socket.makefile("rw", buffering=1)
        self._id = 0
        # Connected late, we may have missed the event: the property does not lie.
        while self._ask("get_property", "time-pos").get("error") != "success":
            time.sleep(0.005)
        self._ask("disable_event", "all")
        self._ask("enable_event", "playback-restart")
        self._ask("enable_event", "end-file")

    pid = property(lambda self: self._process.pid)

    def _send(self, *command):
        self._id += 1
        self._lines.write(json.dumps({"command": command, "request_id": self._id}) + "\n")
        self._lines.flush()

    def _ask(self, *command):
        self._send(*command)
        while True:
            answer = json.loads(self._lines.readline())
            if answer.get("request_id") == self._id and "event" not in answer:
                return answer

    def _wait_for(self, event):
        while json.loads(self._lines.readline()).get("event") != event:
            pass

    def seek(self, seconds):
        """Exactly there; gives the milliseconds until the picture is ready to be drawn."""
        before = time.monotonic_ns()
        self._send("seek", seconds, "absolute+exact")
        self._wait_for("playback-restart")
        return (time.monotonic_ns() - before) / 1e6

    def play(self, seconds):
        self._ask("set_property", "pause", False)
        time.sleep(seconds)
        self._ask("set_property", "pause", True)

    def dropped(self):
        names = ("frame-drop-count", "decoder-frame-drop-count")
        return sum(self._ask("get_property", name).get("data") or 0 for name in names)

    def close(self):
        self._lines.close()
        self._socket.close()
        end(self._process)
        self._directory.cleanup()


class Player:
    """Clipsa's media engine without a window, asked through clipsa-bench-player."""

    name = "Clipsa"

    def __init__(self, program, movie):
        self._process = subprocess.Popen(
            [program, movie], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True, bufsize=1)
        self._answer()

    pid = property(lambda self: self._process.pid)

    def _answer(self):
        line = self._process.stdout.readline()
        if not line.startswith("ok"):
            raise RuntimeError("clipsa-bench-player says: " + (line.strip() or "nothing"))
        return line.split()[1:]

    def _ask(self, *command):
        self._process.stdin.write(" ".join(str(word) for word in command) + "\n")
        self._process.stdin.flush()
        return self._answer()

    def seek(self, seconds):
        """Exactly there; gives the milliseconds until the full picture is ready to be drawn."""
        before = time.monotonic_ns()
        self._ask("seek", seconds)
        return (time.monotonic_ns() - before) / 1e6

    def scrub(self, seconds):
        """As seek, but a picture of that moment in half the size will do, as it does under a moving finger."""
        before = time.monotonic_ns()
        self._ask("scrub", seconds)
        return (time.monotonic_ns() - before) / 1e6

    def play(self, seconds):
        """Gives how many pictures were shown."""
        return int(self._ask("play", seconds)[0])

    def close(self):
        self._process.stdin.close()
        end(self._process)


class Window:
    """A program that shows a movie in a window; measured from outside."""

    def __init__(self, command, screen, **environment):
        self.started = time.monotonic_ns()
        self._errors = tempfile.TemporaryFile("w+")
        self._process = subprocess.Popen(
            command, env={**os.environ, "DISPLAY": screen.name, **environment}, stdin=subprocess.DEVNULL,
            stdout=subprocess.DEVNULL, stderr=self._errors)

    pid = property(lambda self: self._process.pid)

    def is_running(self):
        return self._process.poll() is None

    def processes(self):
        return [self.pid, *children(self.pid)]

    def close(self):
        """Ends it, and gives what it said on standard error."""
        end(self._process)
        self._errors.seek(0)
        with self._errors:
            return self._errors.read()
