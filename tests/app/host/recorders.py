"""Recorders as the service sees them, each with a bus connection of its own. Run by ServiceTest.cpp:

    recorders.py MOVIE SCENARIO

Fails with a traceback when the service does not keep a promise.
"""

import ctypes
import os
import select
import signal
import sys

import dbus
from dbus.bus import BusConnection
from dbus.mainloop.glib import DBusGMainLoop
from gi.repository import GLib

DBusGMainLoop(set_as_default=True)
ADDRESS = os.environ["DBUS_SESSION_BUS_ADDRESS"]
MOVIE, SCENARIO = sys.argv[1:]
loop = GLib.MainLoop()


class Recorder:
    def __init__(self):
        self.bus = BusConnection(ADDRESS)
        self.signals = []
        self.ended = []
        self.bus.add_signal_receiver(lambda path: self.ended.append(path), "Ended", "org.clipsa.RecorderSession1",
                                     path_keyword="path")
        self.results = []
        self.bus.add_signal_receiver(lambda result: self.results.append(result), "Result",
                                     "org.clipsa.RecorderSession1")
        for member in ("Saved", "SaveFailed", "Completed", "Failed"):
            self.bus.add_signal_receiver(self.arrived, member, "org.clipsa.RecorderSession1", path_keyword="path",
                                         member_keyword="member")
        self.recorder = dbus.Interface(self.bus.get_object("org.clipsa.Clipsa", "/org/clipsa/Clipsa"),
                                       "org.clipsa.Recorder1")

    def arrived(self, value, *more, path, member):
        value = [str(v) for v in value] if member == "Completed" else str(value)
        self.signals.append((path, member, value) + tuple(str(m) for m in more))

    def edit(self, file=MOVIE, **options):
        options = {key.replace("_", "-"): value for key, value in options.items()}
        with open(file, "rb") as movie:
            return self.recorder.Edit(dbus.types.UnixFd(movie), dbus.Dictionary(options, signature="sv"))

    def error(self, *arguments, **options):
        try:
            self.edit(*arguments, **options)
        except dbus.DBusException as error:
            return error.get_dbus_name(), error.get_dbus_message()
        raise AssertionError("was accepted")

    def round_trip(self):
        """Everything that was sent to us before has arrived afterwards."""
        self.bus.get_object("org.freedesktop.DBus", "/org/freedesktop/DBus").GetId()
        while GLib.MainContext.default().iteration(False):
            pass


def until(predicate):
    while not predicate():
        GLib.MainContext.default().iteration(True)


def saves():
    """What was saved when the user finished is told before that, the rest behind it, and then that it was all."""
    recorder = Recorder()
    session = recorder.edit()
    until(lambda: recorder.ended)
    assert recorder.ended == [session], recorder.ended
    assert recorder.signals == [(session, "Saved", "/videos/a.mp4"), (session, "Completed", ["save", "save"]),
                                (session, "SaveFailed", "/data/b.mp4", "the disk is full")], recorder.signals


def results():
    """What has become known is told beside the older signals, with a receiver where there is one."""
    asker, bystander = Recorder(), Recorder()
    asker.edit()
    until(lambda: asker.ended)
    assert asker.results == [
        {"outcome": "shared", "type": "Bluetooth", "receiver": "Phone"},
        {"outcome": "saved", "path": "/videos/a.mp4"},
        {"outcome": "not-shared", "type": "Mail", "reason": "it went away"},
        {"outcome": "not-saved", "path": "/data/b.mp4", "reason": "the disk is full"},
    ], asker.results
    assert asker.results[0].signature == "sv"
    assert [member for _, member, *_ in asker.signals] == ["Saved", "SaveFailed", "Completed"], asker.signals
    bystander.round_trip()
    assert bystander.results == [], bystander.results


def completed():
    """Each session is told of its own end, and nobody else is."""
    asker, bystander = Recorder(), Recorder()
    sessions = [asker.edit(), asker.edit(app_name="Racer")]
    assert sessions[0] != sessions[1]
    until(lambda: len(asker.signals) == 2)
    assert sorted(asker.signals) == sorted((s, "Completed", ["save", "share"]) for s in sessions), asker.signals
    bystander.round_trip()
    assert bystander.signals == [], bystander.signals


def failed():
    asker, bystander = Recorder(), Recorder()
    session = asker.edit()
    until(lambda: asker.signals)
    assert asker.signals == [(session, "Failed", "the editor ended early, with exit status 9")], asker.signals
    until(lambda: asker.ended)
    assert asker.ended == [session], asker.ended
    assert asker.results == [{"outcome": "shared", "type": "Bluetooth", "receiver": "Phone"},
                             {"outcome": "failed", "reason": "the editor ended early, with exit status 9"}]
    bystander.round_trip()
    assert bystander.signals == [] and bystander.ended == []


def vanish():
    """The editor of a recorder that leaves is closed; that of another stays until it is asked to go."""
    leaver, stayer = Recorder(), Recorder()
    leaver.edit()
    session = stayer.edit()
    # Held open for writing too: it never ends between the two editors, so what the second one writes is not lost.
    pipe = os.open(os.environ["PIPE_THERE"], os.O_RDWR)
    told = b""
    while told.count(b"MovieURLKey") < 2:
        told += os.read(pipe, 65536)
    os.close(pipe)
    leaver.bus.close()
    with open(os.environ["PIPE_CLOSED"]) as pipe:
        assert "MovieURLKey" in pipe.read()
    stayer.round_trip()
    assert stayer.signals == []
    dbus.Interface(stayer.bus.get_object("org.clipsa.Clipsa", session, introspect=False),
                   "org.clipsa.RecorderSession1").Close(ignore_reply=True)
    with open(os.environ["PIPE_CLOSED"]) as pipe:
        pipe.read()
    until(lambda: stayer.signals)
    assert stayer.signals == [(session, "Failed", "the editor was closed")], stayer.signals


def refused():
    recorder = Recorder()
    bad = "org.clipsa.Error.BadInput"
    directory = os.path.dirname(MOVIE)
    empty = os.path.join(directory, "empty.mp4")
    open(empty, "w").close()
    assert recorder.error(empty) == (bad, "the movie is empty; wait until the recorder has written it")
    assert recorder.error("/dev/null")[0] == bad
    assert recorder.error(tint="reddish")[0] == bad
    assert recorder.error(app_name=1)[0] == bad
    assert recorder.error(message="x" * (1024 * 1024 + 1))[0] == bad
    write_only = os.open(MOVIE, os.O_WRONLY)
    for descriptor in (write_only, os.open(directory, os.O_RDONLY), os.pipe()[0]):
        try:
            recorder.recorder.Edit(dbus.types.UnixFd(descriptor), dbus.Dictionary({}, signature="sv"))
        except dbus.DBusException as error:
            assert error.get_dbus_name() == bad, error
        else:
            raise AssertionError("was accepted")


BAD_PATH = ("org.clipsa.Error.BadInput",
            'the file of the option "attachment" cannot be had by its path; give an open file')


def edit_with_attachment(recorder, movie, attachment):
    """Whether it was taken; else the error."""
    try:
        recorder.recorder.Edit(dbus.types.UnixFd(movie), dbus.Dictionary({"attachment": attachment}, signature="sv"))
    except dbus.DBusException as error:
        return error.get_dbus_name(), error.get_dbus_message()
    return True


def attachments():
    """Files by their paths, for who may read them; one answer where there is nothing to be had."""
    recorder = Recorder()
    directory = os.path.dirname(MOVIE)
    loop_ = os.path.join(directory, "loop")
    os.symlink(loop_, loop_)
    fifo = os.path.join(directory, "fifo")
    os.mkfifo(fifo)
    for path in (directory, loop_, fifo, "/dev/null", "/nowhere", MOVIE + "/", "/" + "x" * (1024 * 1024 - 1)):
        assert recorder.error(attachment=path) == BAD_PATH, path[:100]
    log = os.path.join(directory, "log.txt")
    with open(log, "w") as file:
        file.write("log")
    session = recorder.edit(attachment=log)
    until(lambda: recorder.ended)
    assert recorder.ended == [session] and recorder.signals[0][1] == "Completed", recorder.signals


def confined_by(step):
    """A recorder that goes into a sandbox: no path of its is followed, and its open files are taken."""
    recorder = Recorder()
    movie, attachment = os.open(MOVIE, os.O_RDONLY), os.open(MOVIE, os.O_RDONLY)
    root = os.path.dirname(MOVIE)
    open(os.path.join(root, ".flatpak-info"), "w").close()
    # Whatever the bindings load late, they have loaded.
    assert edit_with_attachment(recorder, movie, "/nowhere") == BAD_PATH
    assert edit_with_attachment(recorder, movie, MOVIE) is True
    until(lambda: recorder.ended)
    try:
        step(root)
    except OSError as error:
        print("SKIPPED: no sandbox can be made here:", error.strerror)
        return
    for path in (MOVIE, "/" + os.path.basename(MOVIE), "/nowhere", "/"):
        assert edit_with_attachment(recorder, movie, path) == BAD_PATH, path
    assert edit_with_attachment(recorder, movie, dbus.types.UnixFd(attachment)) is True
    until(lambda: len(recorder.ended) == 2)


NEW_USER, NEW_MOUNTS = 0x10000000, 0x00020000


def unshare(what):
    """As the super-user or, in a world of our own, as if we were."""
    libc = ctypes.CDLL(None, use_errno=True)
    if libc.unshare(what if os.geteuid() == 0 else NEW_USER | what) != 0:
        raise OSError(ctypes.get_errno(), os.strerror(ctypes.get_errno()))


def other_root():
    def step(root):
        unshare(0)
        os.chroot(root)
        os.chdir("/")

    confined_by(step)


def other_mounts():
    confined_by(lambda _: unshare(NEW_MOUNTS))


def nameless():
    """A file that has no name any more, and one sent along with it."""
    recorder = Recorder()
    path = MOVIE + ".unlinked"
    with open(path, "wb") as file:
        file.write(b"pictures")
    movie = os.open(path, os.O_RDONLY)
    os.unlink(path)
    with open(MOVIE, "rb") as attachment:
        recorder.recorder.Edit(dbus.types.UnixFd(movie),
                               dbus.Dictionary({"attachment": dbus.types.UnixFd(attachment), "name": "../a.webm",
                                                "attachment-name": "../log.txt"}, signature="sv"))
    until(lambda: recorder.signals)
    assert recorder.signals[0][1] == "Completed", recorder.signals


def open_uris():
    application = dbus.Interface(BusConnection(ADDRESS).get_object("org.clipsa.Clipsa", "/org/clipsa/Clipsa"),
                                 "org.freedesktop.Application")
    application.Open(["file://" + MOVIE.replace(" ", "%20")], dbus.Dictionary({}, signature="sv"))


def start_edit(recorder, **options):
    """Edit without waiting; the replies and errors come into the list that it gives."""
    answers = []
    with open(MOVIE, "rb") as movie:
        recorder.recorder.Edit(dbus.types.UnixFd(movie), dbus.Dictionary(options, signature="sv"),
                               reply_handler=answers.append, error_handler=answers.append)
    return answers


def expect_leaving_after_sigterm(bus):
    service = dbus.Interface(bus.get_object("org.freedesktop.DBus", "/org/freedesktop/DBus"), "org.freedesktop.DBus")
    process = service.GetConnectionUnixProcessID("org.clipsa.Clipsa")
    owners = []
    bus.watch_name_owner("org.clipsa.Clipsa", owners.append)
    os.kill(process, signal.SIGTERM)
    until(lambda: owners and not owners[-1])


def slow_file():
    """The file of one cannot be read; the others do not notice, and the service leaves all the same."""
    slow, quick = Recorder(), Recorder()
    answers = start_edit(slow)
    quick.edit(name="a.mp4")
    until(lambda: quick.signals)
    assert quick.signals[0][1] == "Completed", quick.signals
    slow.round_trip()
    assert answers == [], answers
    expect_leaving_after_sigterm(quick.bus)
    until(lambda: answers)
    assert "closed" in str(answers[0]), answers


def slow_copy():
    """Copying does not come to an end; the session does."""
    recorder = Recorder()
    session = recorder.edit(name="a.mp4")
    dbus.Interface(recorder.bus.get_object("org.clipsa.Clipsa", session, introspect=False),
                   "org.clipsa.RecorderSession1").Close()
    until(lambda: recorder.signals)
    assert recorder.signals == [(session, "Failed", "the editor was closed")], recorder.signals
    expect_leaving_after_sigterm(recorder.bus)


def bus_end():
    """The file of one cannot be read, and the bus ends: so does the service."""
    slow, quick = Recorder(), Recorder()
    start_edit(slow)
    quick.edit(name="a.mp4")  # behind the other: the service has that one too
    service = dbus.Interface(quick.bus.get_object("org.freedesktop.DBus", "/org/freedesktop/DBus"),
                             "org.freedesktop.DBus")
    process = os.pidfd_open(service.GetConnectionUnixProcessID("org.clipsa.Clipsa"))
    bus = os.pidfd_open(service.GetConnectionUnixProcessID("org.freedesktop.DBus"))
    for recorder in (slow, quick):
        recorder.bus.set_exit_on_disconnect(False)
    signal.pidfd_send_signal(bus, signal.SIGKILL)
    assert select.select([process], [], [], 30)[0], "the service is still there"


globals()[SCENARIO]()
