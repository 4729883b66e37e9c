#!/usr/bin/python3
"""A manager that velltool works with. Its collections hold no logs, only the reason for them.
SIGTERM stops it."""

import datetime
import os
import signal

import dbus.service
from dbus.mainloop.glib import DBusGMainLoop
from gi.repository import GLib

NAME = "org.vell.Manager1"
FOLDER = (os.environ.get("VELL_SYSROOT", "") +
          "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-")
TRACES = {("SystemLogs", "TraceMode"): "lite", ("Baseband", "TraceEnabled"): "yes"}
SUFFIXES = {"CollectTelephonyLogs": "-telephony", "CollectTelephonyLogsWithCoredump": "-cd",
            "CollectBasebandLogs": "-diag"}


def dictionary(**entries):
    return dbus.Dictionary(entries, signature="sv", variant_level=1)


class Manager(dbus.service.Object):
    state = "Started"

    @dbus.service.method(NAME, in_signature="s")
    def OpenClient(self, client):
        pass

    @dbus.service.method(NAME, in_signature="sa{sv}", out_signature="isv")
    def PerformCommand(self, command, request):
        trace = (request.get("TraceName"), request.get("TracePropertyName"))
        if command == "GetTraceProperty" and trace in TRACES:
            return 0, "", dictionary(TracePropertyValue=TRACES[trace])
        if command == "TraceDumpState" and request.get("TraceAction") in SUFFIXES:
            return self.collect(SUFFIXES[request["TraceAction"]], request)
        return 1, f"cannot do {command}", dictionary()

    def collect(self, suffix, request):
        if request.get("TraceDumpStatePerformCompression") != 0:
            return 2, "cannot pack", dictionary()
        timestamp = datetime.datetime.now().strftime("%Y-%m-%d-%H-%M-%S-%f")[:-3]
        os.makedirs(FOLDER + timestamp + suffix)
        with open(FOLDER + timestamp + suffix + "/reason.txt", "w") as file:
            print(request.get("TraceDumpStateReason") or request.get("BasebandResetReason"), file=file)
        return 0, "", dictionary(TimestampString=timestamp)

    @dbus.service.method(dbus.PROPERTIES_IFACE, in_signature="ss", out_signature="v")
    def Get(self, interface, name):
        return self.state

    @dbus.service.signal(NAME, signature="sv")
    def Event(self, name, payload):
        pass

    def stop(self):
        self.state = "Stopping"
        self.Event("ServerStateChange", dictionary(ServerState=self.state))
        loop.quit()


loop = GLib.MainLoop()
bus = dbus.SystemBus(mainloop=DBusGMainLoop())
manager = Manager(bus, "/org/vell/Manager1")
# The object is there before the name is: the first thing that a client does is to ask it.
name = dbus.service.BusName(NAME, bus, do_not_queue=True)
GLib.unix_signal_add(GLib.PRIORITY_DEFAULT, signal.SIGTERM, manager.stop)
print(NAME, "is on the bus", flush=True)
loop.run()
