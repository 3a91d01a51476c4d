"""What the scripted services have in common: a place on a bus, and a test that drives them line by line.

A service is started as `SERVICE ADDRESS SCRIPT`, where SCRIPT is JSON. It says "ready" when it has its name, then a line
for whatever happens to it; each line of its input is a command, a method of the service with one argument.
"""
import json
import os
import shutil
import sys
import urllib.parse

from gi.repository import Gio, GLib

OBJECT_MANAGER = """<node><interface name="org.freedesktop.DBus.ObjectManager">
  <method name="GetManagedObjects"><arg type="a{oa{sa{sv}}}" direction="out"/></method>
  <signal name="InterfacesAdded"><arg type="o"/><arg type="a{sa{sv}}"/></signal>
  <signal name="InterfacesRemoved"><arg type="o"/><arg type="as"/></signal>
</interface></node>"""


class Refusal(Exception):
    """The call is answered with an error: its name and its words."""


class Service:
    """Calls of the method that the script `holds` are answered when the test says so."""
    name = ""

    def __init__(self):
        self.script = json.loads(sys.argv[2]) if len(sys.argv) > 2 else {}
        self.bus = Gio.DBusConnection.new_for_address_sync(
            sys.argv[1], Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION,
            None, None)
        self.loop = GLib.MainLoop()
        self.bus.connect("closed", lambda *_: self.loop.quit())
        self.exported = {}
        self.held = []
        self.line = ""

    def run(self):
        self.start()
        Gio.bus_own_name_on_connection(self.bus, self.name, Gio.BusNameOwnerFlags.NONE,
                                       lambda *_: self.tell("ready"), lambda *_: self.loop.quit())
        channel = GLib.IOChannel.unix_new(sys.stdin.fileno())
        GLib.io_add_watch(channel, GLib.PRIORITY_DEFAULT, GLib.IO_IN | GLib.IO_HUP, self.command)
        self.loop.run()

    def command(self, _channel, _condition):
        came = os.read(sys.stdin.fileno(), 4096)
        if not came:
            return False
        *lines, self.line = (self.line + came.decode()).split("\n")
        for line in lines:
            verb, _, argument = line.partition(" ")
            getattr(self, "do_" + verb)(argument)
        return True

    def tell(self, line):
        print(line, flush=True)

    def export(self, path, xml, properties=None):
        """Answers calls to the methods of `xml` with what the method of that name gives: a variant, or nothing."""
        for interface in Gio.DBusNodeInfo.new_for_xml(xml).interfaces:
            number = self.bus.register_object(path, interface, self.called,
                                              lambda _bus, _sender, _path, _interface, name: properties[name], None)
            self.exported.setdefault(path, []).append(number)

    def withdraw(self, path):
        for number in self.exported.pop(path, []):
            self.bus.unregister_object(number)

    def called(self, _bus, _sender, path, _interface, method, parameters, invocation):
        if self.script.get("holds") == method:
            self.held.append((path, method, parameters, invocation))
            self.tell("holds " + method)
        else:
            self.answer(path, method, parameters, invocation)

    def do_answer(self, _):
        for call in self.held:
            self.answer(*call)

    def answer(self, path, method, parameters, invocation):
        try:
            answer = getattr(self, method)(path, *parameters.unpack())
        except Refusal as refusal:
            invocation.return_dbus_error(*refusal.args)
            return
        invocation.return_value(answer)

    def emit(self, path, interface, name, variant):
        self.bus.emit_signal(None, path, interface, name, variant)

    def receive(self, file):
        """What arrives at the other end, by a path or an address."""
        if file.startswith("file://"):
            file = urllib.parse.unquote(file[len("file://"):])
        shutil.copyfile(file, os.path.join(self.script["received"], os.path.basename(file)))
        self.tell("received " + os.path.basename(file))


def managed(objects):
    """`objects` by path, their interfaces by name, their properties as variants."""
    return GLib.Variant("(a{oa{sa{sv}}})", (objects,))


def variants(properties):
    kinds = {bool: "b", str: "s", list: "as", int: "t"}
    return {name: GLib.Variant("o" if name in ("Adapter", "Session") else kinds[type(value)], value)
            for name, value in properties.items()}
