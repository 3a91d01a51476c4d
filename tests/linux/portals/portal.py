#!/usr/bin/python3
"""A desktop on the session bus, whose user does what a test says: portal, file manager, an application that sends messages.

    portal.py DIRECTORY BEHAVIOUR NAME=VERSION…

It follows the published interfaces org.freedesktop.portal.{Email,OpenURI,FileChooser,Request} as far as the editor needs
them; NAME is the last part of an interface that is there. `FileManager=1` and `Messages=1` bring the other two.

BEHAVIOUR, for each request:
    done          takes it: response 0; a chooser has chosen DIRECTORY/chosen/copy.mp4, or what DIRECTORY/choice says
    first         the same, but responds before it answers the call
    own-path      the same, at a path of its own, as old portals do
    cancel, fail  response 1, and response 2
    error         answers the call with an error
    silent        does not answer the call; when DIRECTORY/go-on appears it answers, and waits
    hold          waits: for its Close, or until DIRECTORY/go-on appears, when it takes it
    odd-reply     answers the call with what is no request
    odd-response  responds with what has no meaning
    mute          does not even say which versions there are

What it is asked goes to DIRECTORY/calls, one JSON object a line; the bytes of the n-th descriptor to DIRECTORY/bytes-n.
"""

import fcntl
import json
import os
import sys

import dbus
import dbus.lowlevel
import dbus.mainloop.glib
from gi.repository import GLib

PORTAL = "org.freedesktop.portal."
DESKTOP = "/org/freedesktop/portal/desktop"
SIGNATURES = {
    "ComposeEmail": "sa{sv}",
    "OpenURI": "ssa{sv}",
    "OpenFile": "sha{sv}",
    "OpenDirectory": "sha{sv}",
    "SaveFile": "ssa{sv}",
}

directory, behaviour = sys.argv[1:3]
versions = {name: int(version) for name, version in (word.split("=") for word in sys.argv[3:])}
received = 0


def plain(value):
    """As JSON has it; descriptors as the file that holds what could be read from them."""
    global received
    if isinstance(value, dbus.types.UnixFd):
        number = value.take()
        name = f"bytes-{received}"
        received += 1
        with os.fdopen(number, "rb") as source, open(os.path.join(directory, name), "wb") as copy:
            flags = os.O_ACCMODE & fcntl.fcntl(source.fileno(), fcntl.F_GETFL)
            copy.write(source.read())
        return {"bytes": name, "writable": flags != os.O_RDONLY}
    if isinstance(value, dbus.ByteArray) or isinstance(value, dbus.Array) and value.signature == "y":
        return bytes(value).decode()
    if isinstance(value, dict):
        return {str(key): plain(item) for key, item in value.items()}
    if isinstance(value, (list, tuple)):
        return [plain(item) for item in value]
    if isinstance(value, dbus.Boolean):
        return bool(value)
    return int(value) if isinstance(value, int) else str(value)


def note(**what):
    with open(os.path.join(directory, "calls"), "a", encoding="utf-8") as calls:
        calls.write(json.dumps(what, ensure_ascii=False) + "\n")


def reply(call, signature="", *values):
    message = dbus.lowlevel.MethodReturnMessage(call)
    if signature:
        message.append(signature=signature, *values)
    bus.send_message(message)


def refuse(call, name, text):
    bus.send_message(dbus.lowlevel.ErrorMessage(call, name, text))


def respond(call, path, code, results=None):
    signal = dbus.lowlevel.SignalMessage(path, PORTAL + "Request", "Response")
    signal.set_destination(call.get_sender())
    if behaviour == "odd-response":
        signal.append("yes", signature="s")
    else:
        signal.append(dbus.UInt32(code), dbus.Dictionary(results or {}, signature="sv"), signature="ua{sv}")
    bus.send_message(signal)


def results_of(member):
    if member != "SaveFile":
        return {}
    choice = os.path.join(directory, "choice")
    if os.path.exists(choice):
        with open(choice, encoding="utf-8") as file:
            uris = file.read().split()
    else:
        uris = ["file://" + os.path.join(directory, "chosen", "copy.mp4")]
    return {"uris": dbus.Array(uris, signature="s", variant_level=1)}


def when_told(action):
    def wait():
        if not os.path.exists(os.path.join(directory, "go-on")):
            return True
        action()
        return False

    GLib.timeout_add(5, wait)


def request(call, interface, member):
    arguments = [plain(value) for value in call.get_args_list()]
    token = arguments[-1].get("handle_token", "none")
    sender = call.get_sender()[1:].replace(".", "_")
    path = f"{DESKTOP}/request/{sender}/{token}"
    if behaviour == "own-path":
        path += "_of_its_own"
    note(interface=interface, member=member, signature=call.get_signature(), arguments=arguments, path=path)

    def answer():
        reply(call, "o", dbus.ObjectPath(path))

    code = {"done": 0, "first": 0, "own-path": 0, "odd-response": 0, "cancel": 1, "fail": 2}.get(behaviour)
    if call.get_signature() != SIGNATURES[member]:
        refuse(call, "org.freedesktop.DBus.Error.InvalidArgs", "its arguments are wrong")
    elif behaviour == "error":
        refuse(call, PORTAL + "Error.Failed", "no")
    elif behaviour == "odd-reply":
        reply(call, "s", "yes")
    elif behaviour == "hold":
        answer()
        # Who answers this has read our answer.
        bus.call_async(call.get_sender(), "/", "org.freedesktop.DBus.Peer", "Ping", "", (),
                       lambda: print("holds", flush=True), lambda _: None)
        when_told(lambda: respond(call, path, 0, results_of(member)))
    elif behaviour == "silent":
        when_told(answer)
    elif behaviour == "first":
        respond(call, path, code, results_of(member))
        answer()
    else:
        answer()
        # Whoever knows the path only from the answer can listen by then.
        GLib.timeout_add(100 if behaviour == "own-path" else 0,
                         lambda: respond(call, path, code, results_of(member)) and False)


def handle(_, call):
    if call.get_type() != dbus.lowlevel.MESSAGE_TYPE_METHOD_CALL:
        return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
    interface, member, path = call.get_interface(), call.get_member(), call.get_path()
    name = (interface or "").removeprefix(PORTAL)
    if interface == "org.freedesktop.DBus.Properties" and path == DESKTOP:
        asked, key = call.get_args_list()
        version = versions.get(asked.removeprefix(PORTAL))
        if behaviour == "mute":
            pass
        elif member == "Get" and key == "version" and version:
            reply(call, "v", dbus.UInt32(version))
        else:
            refuse(call, "org.freedesktop.DBus.Error.InvalidArgs", f"there is no {asked}")
    elif name == "Request" and member == "Close":
        note(interface=interface, member=member, path=path)
        reply(call)
    elif name in versions and member in SIGNATURES and path == DESKTOP:
        request(call, interface, member)
    elif interface == "org.freedesktop.FileManager1" and member == "ShowItems" and "FileManager" in versions:
        note(interface=interface, member=member, arguments=[plain(value) for value in call.get_args_list()])
        if behaviour == "error":
            refuse(call, "org.freedesktop.DBus.Error.Failed", "no")
        elif behaviour != "silent":
            reply(call)
    elif interface == "org.freedesktop.Application" and member == "Open" and "Messages" in versions:
        note(interface=interface, member=member, path=path,
             arguments=[plain(value) for value in call.get_args_list()])
        if behaviour == "error":
            refuse(call, "org.freedesktop.DBus.Error.Failed", "no")
        elif behaviour != "silent":
            reply(call)
    else:
        return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
    return dbus.lowlevel.HANDLER_RESULT_HANDLED


dbus.mainloop.glib.DBusGMainLoop(set_as_default=True)
bus = dbus.SessionBus()
bus.add_message_filter(handle)
names = []
if set(versions) - {"FileManager", "Messages"} or behaviour == "mute":
    names.append(PORTAL + "Desktop")
if "FileManager" in versions:
    names.append("org.freedesktop.FileManager1")
if "Messages" in versions:
    names.append("org.example.Messages")
for name in names:
    bus.request_name(name)
print("ready", flush=True)
GLib.MainLoop().run()
