#!/usr/bin/python3
"""BlueZ as its users on the system bus see it: the script has its `adapters` and `devices`, by path, their properties."""
from scripted import OBJECT_MANAGER, Service, managed, variants


class BlueZ(Service):
    name = "org.bluez"

    def start(self):
        self.export("/", OBJECT_MANAGER)

    def GetManagedObjects(self, _path):
        objects = {"/org/bluez": {"org.bluez.AgentManager1": {}}}
        for kind, interface in (("adapters", "org.bluez.Adapter1"), ("devices", "org.bluez.Device1")):
            for path, properties in self.script[kind].items():
                objects[path] = {interface: variants(properties)}
        return managed(objects)


BlueZ().run()
