#!/usr/bin/python3
"""KDE Connect's daemon as its users on the bus see it.

The script has its `devices`: by identifier their properties and their `plugins`; where it is to receive files; whether it
takes them `later`; how the address of one that it `refuses` ends; `ghosts`, which are
listed and not there.
"""
from gi.repository import GLib

from scripted import Refusal, Service, variants

DAEMON = """<node><interface name="org.kde.kdeconnect.daemon">
  <method name="devices">
    <arg name="onlyReachable" type="b" direction="in"/><arg name="onlyPaired" type="b" direction="in"/>
    <arg type="as" direction="out"/>
  </method>
</interface></node>"""

DEVICE = """<node><interface name="org.kde.kdeconnect.device">
  <property name="name" type="s" access="read"/>
  <property name="type" type="s" access="read"/>
  <property name="isReachable" type="b" access="read"/>
  <property name="%s" type="b" access="read"/>
  <method name="hasPlugin"><arg name="name" type="s" direction="in"/><arg type="b" direction="out"/></method>
</interface></node>"""

SHARE = """<node><interface name="org.kde.kdeconnect.device.share">
  <method name="shareUrl"><arg name="url" type="s" direction="in"/></method>
  <method name="shareUrls"><arg name="urls" type="as" direction="in"/></method>
  <method name="shareText"><arg name="text" type="s" direction="in"/></method>
</interface></node>"""


class KdeConnect(Service):
    name = "org.kde.kdeconnect"
    root = "/modules/kdeconnect"

    def start(self):
        self.known = self.script["devices"]
        self.waiting = []
        self.export(self.root, DAEMON)
        for identifier, device in self.known.items():
            path = self.root + "/devices/" + identifier
            paired = "isPaired" if "isPaired" in device else "isTrusted"
            self.export(path, DEVICE % paired, variants({name: device[name] for name in device if name != "plugins"}))
            self.export(path + "/share", SHARE)

    def devices(self, _path, only_reachable, only_paired):
        self.tell(f"devices {only_reachable} {only_paired}")
        return GLib.Variant("(as)", ([*self.script.get("ghosts", []), *self.known],))

    def hasPlugin(self, path, name):
        return GLib.Variant("(b)", (name in self.known[path.rsplit("/", 1)[1]]["plugins"],))

    def shareUrl(self, _path, url):
        if url.endswith(self.script.get("refuses", "nothing")):
            raise Refusal("org.freedesktop.DBus.Error.Failed", "no")
        if "later" in self.script:
            self.waiting.append(url)
            self.tell("accepted " + url)
        else:
            self.receive(url)

    def do_relent(self, _):
        del self.script["refuses"]

    def do_transfer(self, _):
        for url in self.waiting:
            self.receive(url)

    def do_lose(self, identifier):
        self.withdraw(self.root + "/devices/" + identifier + "/share")
        self.tell("lost")


KdeConnect().run()
