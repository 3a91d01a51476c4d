"""What a screen reader does, over the real bus: waits for the editor, reads its tree, and does what a person asks for.

Each argument is a step: `wait NAME` until something of that name is there, `gone NAME` until it is not, `tree` to print what is
shown, one object a line, two spaces for each level: its role, its name, and its value or text where there is one, `do NAME` to
carry out the object's first action, `focus NAME` to give it the focus."""

import sys
import time

import dbus

ACCESSIBLE = "org.a11y.atspi.Accessible"
PROPERTIES = "org.freedesktop.DBus.Properties"
DEADLINE = 30  # seconds
SHOWING = 25  # the number of the state


def accessibilityBus():
    status = dbus.SessionBus().get_object("org.a11y.Bus", "/org/a11y/bus")
    return dbus.bus.BusConnection(status.GetAddress(dbus_interface="org.a11y.Bus"))


class Thing:
    def __init__(self, bus, name, path):
        self.bus, self.at, self.path = bus, name, path
        self.object = bus.get_object(name, path, introspect=False)

    def ask(self, method, *arguments, interface=ACCESSIBLE):
        return self.object.get_dbus_method(method, interface)(*arguments)

    def property(self, name, interface=ACCESSIBLE):
        return self.ask("Get", interface, name, interface=PROPERTIES)

    def name(self):
        return str(self.property("Name"))

    def role(self):
        return str(self.ask("GetRoleName"))

    def isShowing(self):
        return bool(int(self.ask("GetState")[0]) >> SHOWING & 1)

    def interfaces(self):
        return [str(each) for each in self.ask("GetInterfaces")]

    def detail(self):
        interfaces = self.interfaces()
        if "org.a11y.atspi.Value" in interfaces:
            return f" = {float(self.property('CurrentValue', 'org.a11y.atspi.Value')):g}"
        return ""

    def children(self):
        for name, path in self.ask("GetChildren"):
            yield Thing(self.bus, name, path)


def things(bus):
    """All that is shown, with its level, from the applications down."""
    def walk(thing, level):
        yield thing, level
        for child in thing.children():
            if child.isShowing():
                yield from walk(child, level + 1)

    root = Thing(bus, "org.a11y.atspi.Registry", "/org/a11y/atspi/accessible/root")
    for application in root.children():
        for window in application.children():
            yield from walk(window, 0)


def find(bus, wanted):
    try:
        return next((thing for thing, _ in things(bus) if thing.name() == wanted), None)
    except dbus.DBusException:
        return None  # it went while it was looked at


def until(condition, what):
    end = time.monotonic() + DEADLINE
    while True:
        found = condition()
        if found:
            return found
        if time.monotonic() > end:
            sys.exit(f"{what}: not within {DEADLINE} seconds")
        time.sleep(0.02)


def main():
    bus = accessibilityBus()
    for step in sys.argv[1:]:
        what, _, name = step.partition(" ")
        if what == "wait":
            until(lambda: find(bus, name), step)
        elif what == "gone":
            until(lambda: not find(bus, name), step)
        elif what == "tree":
            for thing, level in things(bus):
                print("  " * level + f"{thing.role()} “{thing.name()}”{thing.detail()}")
        elif what == "do":
            until(lambda: find(bus, name), step).ask("DoAction", dbus.Int32(0), interface="org.a11y.atspi.Action")
        elif what == "focus":
            until(lambda: find(bus, name), step).ask("GrabFocus", interface="org.a11y.atspi.Component")
        else:
            sys.exit(f"there is no step {step}")


main()
