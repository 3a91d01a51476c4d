#!/usr/bin/python3
"""GSConnect as its users on the bus see it: its devices are managed objects, what they can do are exported actions.

The script has its `devices`: by identifier their properties, and under `actions` whether sharing is enabled or absent.
"""
from gi.repository import Gio, GLib

from scripted import OBJECT_MANAGER, Service, managed, variants


class GsConnect(Service):
    name = "org.gnome.Shell.Extensions.GSConnect"
    root = "/org/gnome/Shell/Extensions/GSConnect"

    def start(self):
        self.actions = {}
        self.groups = {}
        self.objects = {}
        self.export(self.root, OBJECT_MANAGER)
        for identifier, device in self.script["devices"].items():
            path = self.root + "/Device/" + identifier
            properties = {name: value for name, value in device.items() if name not in ("sharing", "type")}
            self.objects[path] = {"org.gnome.Shell.Extensions.GSConnect.Device": variants(properties)}
            group = Gio.SimpleActionGroup()
            if "sharing" in device:
                action = Gio.SimpleAction.new("shareFile", GLib.VariantType.new(device.get("type", "(sb)")))
                action.set_enabled(device["sharing"])
                action.connect("activate", self.share)
                group.add_action(action)
                self.actions[identifier] = action
            self.groups[identifier] = self.bus.export_action_group(path, group)

    def GetManagedObjects(self, _path):
        return managed(self.objects)

    def share(self, _action, parameter):
        address, opens = parameter.unpack()
        self.tell(f"opens {opens}")
        self.receive(address)

    def do_disable(self, identifier):
        self.actions[identifier].set_enabled(False)
        self.tell("disabled")

    def do_remove(self, identifier):
        self.bus.unexport_action_group(self.groups[identifier])
        self.tell("removed")


GsConnect().run()
