#!/usr/bin/python3
"""Edits a movie with Clipsa as a recorder does: hands in an open file, and waits until the user has finished.

    record_and_edit.py MOVIE [APP-NAME]

Prints the activity types, one a line, and what became of shares on standard error. Needs python3-dbus and python3-gi.
"""

import sys

import dbus
from dbus.mainloop.glib import DBusGMainLoop
from gi.repository import GLib

DAY = 24 * 60 * 60  # seconds

DBusGMainLoop(set_as_default=True)
loop = GLib.MainLoop()
status = 1
save_status = 0


def completed(activity_types):
    global status
    for activity_type in activity_types:
        print(activity_type)
    status = 0


def save_failed(path, message):
    global save_status
    where = f"it is kept as {path}" if path else "it could not be kept elsewhere"
    print(f"the movie is not in your videos ({message}); {where}", file=sys.stderr)
    save_status = 1


def told(result):
    # Of saves and of the session we hear by signals of their own.
    receiver = f" with {result['receiver']}" if "receiver" in result else ""
    if result["outcome"] == "shared":
        print(f"shared{receiver} by {result['type']}", file=sys.stderr)
    elif result["outcome"] == "not-shared":
        print(f"not shared{receiver} by {result['type']}: {result.get('reason', 'nobody knows why')}", file=sys.stderr)


def failed(message):
    global status
    print(message, file=sys.stderr)
    status = 1


def ended():
    # Only now it is known what became of a save that was under way when the user finished.
    loop.quit()


def service_left(owner):
    # Clipsa itself has gone, and with it the session.
    if not owner and loop.is_running():
        failed("Clipsa ended unexpectedly")
        loop.quit()


if len(sys.argv) not in (2, 3):
    sys.exit("record_and_edit.py MOVIE [APP-NAME]")
movie = sys.argv[1]
options = {"name": movie.rsplit("/", 1)[-1]}
if len(sys.argv) > 2:
    options["app-name"] = sys.argv[2]

SESSION = "org.clipsa.RecorderSession1"
try:
    bus = dbus.SessionBus()
    # Listened to before the call, so that no answer can be missed; they come to us alone.
    bus.add_signal_receiver(completed, "Completed", SESSION)
    bus.add_signal_receiver(save_failed, "SaveFailed", SESSION)
    bus.add_signal_receiver(told, "Result", SESSION)
    bus.add_signal_receiver(failed, "Failed", SESSION)
    bus.add_signal_receiver(ended, "Ended", SESSION)
    recorder = dbus.Interface(bus.get_object("org.clipsa.Clipsa", "/org/clipsa/Clipsa"), "org.clipsa.Recorder1")
    with open(movie, "rb") as file:
        # A slow disk or network delays the answer, which is worth waiting for.
        recorder.Edit(dbus.types.UnixFd(file), dbus.Dictionary(options, signature="sv"), timeout=DAY)
    bus.watch_name_owner("org.clipsa.Clipsa", service_left)
    loop.run()
except OSError as error:
    sys.exit(f"cannot read {movie}: {error.strerror}")
except dbus.DBusException as error:
    sys.exit(error.get_dbus_message())
except KeyboardInterrupt:
    sys.exit(130)  # the editor closes with our connection
sys.exit(status or save_status)
