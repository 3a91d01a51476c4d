#!/usr/bin/python3
"""The OBEX service as its clients on the session bus see it; a command says what becomes of the transfer under way.

The script says where files are received, whether it `refuses` sessions or files, whether a transfer is over `at once`,
before its sender knows of it.
"""
import os

from gi.repository import GLib

from scripted import OBJECT_MANAGER, Refusal, Service, managed, variants

CLIENT = """<node><interface name="org.bluez.obex.Client1">
  <method name="CreateSession">
    <arg name="destination" type="s" direction="in"/><arg name="args" type="a{sv}" direction="in"/>
    <arg name="session" type="o" direction="out"/>
  </method>
  <method name="RemoveSession"><arg name="session" type="o" direction="in"/></method>
</interface></node>"""

PUSH = """<node><interface name="org.bluez.obex.ObjectPush1">
  <method name="SendFile">
    <arg name="sourcefile" type="s" direction="in"/>
    <arg name="transfer" type="o" direction="out"/><arg name="properties" type="a{sv}" direction="out"/>
  </method>
</interface></node>"""

TRANSFER = """<node><interface name="org.bluez.obex.Transfer1"><method name="Cancel"/></interface></node>"""


class Obexd(Service):
    name = "org.bluez.obex"

    def start(self):
        self.sessions = 0
        self.transfers = 0
        self.export("/", OBJECT_MANAGER)
        self.export("/org/bluez/obex", CLIENT)

    def GetManagedObjects(self, _path):
        return managed({})

    def CreateSession(self, _path, destination, arguments):
        if self.script.get("refuses") == "session":
            raise Refusal("org.bluez.obex.Error.Failed", "Host is down")
        self.sessions += 1
        self.session = f"/org/bluez/obex/client/session{self.sessions}"
        self.export(self.session, PUSH)
        self.tell(f"session {destination} {arguments['Target']} {arguments['Source']}")
        return GLib.Variant("(o)", (self.session,))

    def RemoveSession(self, _path, session):
        self.withdraw(session)
        self.tell("session removed")

    def SendFile(self, path, file):
        if self.script.get("refuses") == "file":
            raise Refusal("org.bluez.obex.Error.InvalidArguments", "No such file")
        self.transfers += 1
        self.file = file
        self.transfer = f"{path}/transfer{self.transfers}"
        self.export(self.transfer, TRANSFER)
        properties = {"Status": "queued", "Name": os.path.basename(file), "Size": os.path.getsize(file),
                      "Session": path}
        if "at once" in self.script:
            self.do_complete("")
        self.tell("sending " + os.path.basename(file))
        return GLib.Variant("(oa{sv})", (self.transfer, variants(properties)))

    def Cancel(self, _path):
        self.tell("cancelled")

    def change(self, transfer, properties):
        self.emit(transfer, "org.freedesktop.DBus.Properties", "PropertiesChanged",
                  GLib.Variant("(sa{sv}as)", ("org.bluez.obex.Transfer1", variants(properties), [])))

    def do_progress(self, transferred):
        self.change(self.transfer, {"Status": "active", "Transferred": int(transferred)})

    def do_suspend(self, _):
        self.change(self.transfer, {"Status": "suspended"})

    def do_others(self, _):
        self.change("/org/bluez/obex/client/session99/transfer1", {"Status": "error"})
        self.change(self.transfer + "0", {"Status": "error"})

    def do_complete(self, _):
        self.receive(self.file)
        self.change(self.transfer, {"Status": "complete", "Transferred": os.path.getsize(self.file)})
        self.do_vanish("")

    def do_error(self, _):
        self.change(self.transfer, {"Status": "error"})

    def do_vanish(self, _):
        self.remove(self.transfer, "org.bluez.obex.Transfer1")

    def do_hangup(self, _):
        self.remove(self.session, "org.bluez.obex.Session1")

    def remove(self, path, interface):
        self.withdraw(path)
        self.emit("/", "org.freedesktop.DBus.ObjectManager", "InterfacesRemoved",
                  GLib.Variant("(oas)", (path, ["org.freedesktop.DBus.Properties", interface])))


Obexd().run()
