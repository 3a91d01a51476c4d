"""A screen of our own, and a look at one of its pixels: what is on it is the same question for every program."""

import ctypes
import os
import subprocess
import time

SIZE = (960, 640)
# Left of and above the middle, where Clipsa has its play button, and far from all bars.
SPOT = (SIZE[0] // 2 - 80, SIZE[1] // 2 - 80)


class _Image(ctypes.Structure):
    _fields_ = [
        ("width", ctypes.c_int), ("height", ctypes.c_int), ("xoffset", ctypes.c_int), ("format", ctypes.c_int),
        ("data", ctypes.POINTER(ctypes.c_ubyte)), ("byte_order", ctypes.c_int),
    ]


class Screen:
    """An X server without a window manager, as large as Clipsa's window: every window begins in its corner."""

    def __init__(self):
        read, write = os.pipe()
        self._server = subprocess.Popen(
            ["Xvfb", "-displayfd", str(write), "-screen", "0", f"{SIZE[0]}x{SIZE[1]}x24", "-nolisten", "tcp"],
            pass_fds=[write], stderr=subprocess.DEVNULL)
        os.close(write)
        with os.fdopen(read) as answer:
            self.name = ":" + answer.readline().strip()
        self._x = ctypes.CDLL("libX11.so.6")
        self._x.XOpenDisplay.restype = ctypes.c_void_p
        self._x.XDefaultRootWindow.argtypes = [ctypes.c_void_p]
        self._x.XDefaultRootWindow.restype = ctypes.c_ulong
        self._x.XGetImage.argtypes = [
            ctypes.c_void_p, ctypes.c_ulong, ctypes.c_int, ctypes.c_int, ctypes.c_uint, ctypes.c_uint, ctypes.c_ulong,
            ctypes.c_int]
        self._x.XGetImage.restype = ctypes.POINTER(_Image)
        self._x.XDestroyImage.argtypes = [ctypes.POINTER(_Image)]
        self._connection = self._x.XOpenDisplay(self.name.encode())
        if not self._connection:
            raise RuntimeError("cannot reach the X server " + self.name)
        self._root = self._x.XDefaultRootWindow(self._connection)

    def close(self):
        self._x.XCloseDisplay(ctypes.c_void_p(self._connection))
        self._server.terminate()
        self._server.wait()

    def colour(self):
        """Red, green and blue at the spot."""
        image = self._x.XGetImage(self._connection, self._root, *SPOT, 1, 1, 0xFFFFFFFF, 2)
        blue, green, red = image.contents.data[0], image.contents.data[1], image.contents.data[2]
        self._x.XDestroyImage(image)
        return red, green, blue

    def wait_for(self, colour, limit, every=0.001, meanwhile=lambda: None):
        """Until the spot has that colour; gives the nanoseconds of CLOCK_MONOTONIC."""
        end = time.monotonic() + limit
        while time.monotonic() < end:
            if is_like(self.colour(), colour):
                return time.monotonic_ns()
            meanwhile()
            time.sleep(every)
        raise TimeoutError(f"the picture did not come: {self.colour()} stands where {colour} should")

    def wait_until_empty(self, limit=10):
        self.wait_for((0, 0, 0), limit)


def is_like(colour, other):
    # Players differ in which matrix they take for a movie that names none.
    return all(abs(a - b) <= 48 for a, b in zip(colour, other))


def colour_of(movie):
    """The colour at the spot when a movie's first picture is fitted into the screen."""
    fitted = f"scale={SIZE[0]}:{SIZE[1]}:force_original_aspect_ratio=decrease,pad={SIZE[0]}:{SIZE[1]}:-1:-1"
    pixels = subprocess.run(
        ["ffmpeg", "-nostdin", "-v", "error", "-i", movie, "-frames:v", "1", "-vf", f"{fitted},crop=4:4:{SPOT[0] - 2}:{SPOT[1] - 2},scale=1:1", "-f",
         "rawvideo", "-pix_fmt", "rgb24", "-"], check=True, capture_output=True).stdout
    colour = tuple(pixels[:3])
    # Windows are black before.
    if max(colour) < 96:
        raise RuntimeError(f"{movie} begins too dark ({colour}) at the spot that is watched")
    return colour
