"""A template for python-dbusmock: a manager that answers as a test tells it to.

What is answered is named by its property, as "Baseband.TraceEnabled", or by its action, as
"CollectTelephonyLogs"; "" is all that has no answer of its own."""

from xml.etree import ElementTree

import dbus
from dbusmock import MOCK_IFACE
from dbusmock.mockobject import DBusMockObject

SYSTEM_BUS = True
BUS_NAME = MAIN_IFACE = "org.vell.Manager1"
MAIN_OBJ = "/org/vell/Manager1"


def dictionary(entries):
    return dbus.Dictionary(entries, signature="sv", variant_level=1)


def load(mock, parameters):
    """The parameter ServerState is the state to begin with."""
    mock.answers = {"": (0, {"TracePropertyValue": "yes", "TimestampString": "T"})}
    mock.errors, mock.delays, mock.silent = {}, {}, set()
    mock.AddProperty(MAIN_IFACE, "ServerState", parameters.get("ServerState", "Started"))

    @dbus.service.method(dbus.INTROSPECTABLE_IFACE, out_signature="s", path_keyword="path",
                         connection_keyword="connection")
    def Introspect(self, path, connection):
        node = ElementTree.fromstring(DBusMockObject.Introspect(self, path, connection))
        interface = node.find(f"interface[@name='{MAIN_IFACE}']")
        interface.find("property").set("access", "read")
        event = ElementTree.SubElement(interface, "signal", name="Event")
        ElementTree.SubElement(event, "arg", name="name", type="s")
        ElementTree.SubElement(event, "arg", name="payload", type="v")
        return ElementTree.tostring(node, encoding="unicode")

    mock.methods[dbus.INTROSPECTABLE_IFACE] = {"Introspect": ("", "s", "", Introspect)}


@dbus.service.method(dbus.PROPERTIES_IFACE, in_signature="ssv")
def Set(self, interface, name, value):
    raise dbus.exceptions.DBusException(name + " is read only",
                                        name="org.freedesktop.DBus.Error.PropertyReadOnly")


@dbus.service.method(MAIN_IFACE, in_signature="s")
def OpenClient(self, client):
    pass


@dbus.service.method(MAIN_IFACE, in_signature="sa{sv}", out_signature="isv",
                     async_callbacks=("reply", "fail"))
def PerformCommand(self, command, request, reply, fail):
    what = request.get("TraceAction") or ".".join(
        (request.get("TraceName", ""), request.get("TracePropertyName", "")))

    def of(table):
        return table.get(what, table.get(""))

    def answer():
        if of(self.errors):
            fail(dbus.exceptions.DBusException("as the test says", name=of(self.errors)))
        else:
            status, entries = of(self.answers)
            reply(status, "", dictionary(entries))

    if not self.silent & {what, ""}:
        from gi.repository import GLib  # Not above: the test loads this file too, and needs no loop.
        GLib.timeout_add(of(self.delays) or 0, answer)


@dbus.service.method(MOCK_IFACE, in_signature="sia{sv}")
def Answer(self, what, status, reply):
    """Has `what` answered with `status` and `reply`."""
    self.answers[what] = (status, reply)


@dbus.service.method(MOCK_IFACE, in_signature="ss")
def Fail(self, what, error):
    """Has `what` answered with the D-Bus error of that name; "" ends it."""
    if error:
        dbus.validate_error_name(error)
    self.errors[what] = error


@dbus.service.method(MOCK_IFACE, in_signature="su")
def Delay(self, what, milliseconds):
    """Has `what` answered so much later."""
    self.delays[what] = milliseconds


@dbus.service.method(MOCK_IFACE, in_signature="s")
def BeSilent(self, what):
    """Has `what` never answered."""
    self.silent.add(what)


@dbus.service.method(MOCK_IFACE, in_signature="s")
def ChangeServerState(self, state):
    """Gives the manager a server state and sends the event of it."""
    self.props[MAIN_IFACE]["ServerState"] = state
    self.EmitSignal(MAIN_IFACE, "Event", "sv",
                    ["ServerStateChange", dictionary({"ServerState": state})])
