"""A template for python-dbusmock: a manager that answers as a test tells it to."""

import dbus
from dbusmock import MOCK_IFACE

SYSTEM_BUS = True
BUS_NAME = MAIN_IFACE = "org.vell.Manager1"
MAIN_OBJ = "/org/vell/Manager1"


def load(mock, parameters):
    """The parameter ServerState is the state to begin with."""
    mock.answers = {"GetTraceProperty": (0, {"TracePropertyValue": "yes"}),
                    "TraceDumpState": (0, {"TimestampString": "T"})}
    mock.AddProperty(MAIN_IFACE, "ServerState", parameters.get("ServerState", "Started"))


@dbus.service.method(MAIN_IFACE, in_signature="s")
def OpenClient(self, client):
    pass


@dbus.service.method(MAIN_IFACE, in_signature="sa{sv}", out_signature="isv")
def PerformCommand(self, command, request):
    status, reply = self.answers[command]
    return status, "", dbus.Dictionary(reply, signature="sv", variant_level=1)


@dbus.service.method(MOCK_IFACE, in_signature="sia{sv}")
def Answer(self, command, status, reply):
    """Has each further `command` answered with `status` and `reply`."""
    self.answers[command] = (status, reply)


@dbus.service.method(MOCK_IFACE, in_signature="s")
def ChangeServerState(self, state):
    """Gives the manager a server state and sends the event of it."""
    self.props[MAIN_IFACE]["ServerState"] = state
    payload = dbus.Dictionary({"ServerState": state}, signature="sv", variant_level=1)
    self.EmitSignal(MAIN_IFACE, "Event", "sv", ["ServerStateChange", payload])
