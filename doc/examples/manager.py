#!/usr/bin/python3
"""A manager for velltool. Its collections hold no logs, only the reason for them. SIGTERM and Ctrl-C
end it. SIGUSR1 switches the baseband trace on and off, for want of a radio that has one."""

import concurrent.futures
import contextlib
import datetime
import os
import shlex
import signal
import sys
import tarfile
import tempfile
import threading
import time

from gi.repository import Gio, GLib

NAME, OBJECT = "org.vell.Manager1", "/org/vell/Manager1"
INTERFACE = """<node><interface name="org.vell.Manager1">
  <method name="OpenClient"><arg name="clientName" type="s" direction="in"/></method>
  <method name="PerformCommand">
    <arg name="command" type="s" direction="in"/> <arg name="request" type="a{sv}" direction="in"/>
    <arg name="status" type="i" direction="out"/> <arg name="message" type="s" direction="out"/>
    <arg name="reply" type="v" direction="out"/></method>
  <signal name="Event"><arg name="name" type="s"/> <arg name="payload" type="v"/></signal>
  <property name="ServerState" type="s" access="read"/>
</interface></node>"""

# A simulated device lies below this root. No reply has it in it.
ROOT = os.environ.get("VELL_SYSROOT", "")
COLLECTIONS = ROOT + "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/"
LIVE_TRACES = ROOT + "/private/var/wireless/Library/Logs/VellManager/"
SAVED_TRACES = ROOT + "/var/lib/vell/traces.conf"

FAILED, NOT_RUNNING = 1, 0xE020E001 - 2**32


profile = {}
with contextlib.suppress(OSError), open(ROOT + "/etc/vell/device.conf", encoding="utf-8", errors="replace") as file:
    for line in file:  # See os-release(5). A line that cannot be read costs that line alone.
        with contextlib.suppress(ValueError):
            profile.update(word.split("=", 1) for word in shlex.split(line, comments=True))
vendor2 = profile.get("RADIO_VENDOR") == "2"
high = profile.get("RADIO_DIAG_QDSS") == "yes"
# What a collection consists of, by the ends of the folders' names.
FOLDERS = {"CollectTelephonyLogs": ["-telephony"],
           "CollectTelephonyLogsWithCoredump": ["-telephony", "-coredump" if vendor2 else "-cd"],
           "CollectBasebandLogs": ["-bb-trace" if vendor2 else "-qdss" if high else "-diag"]}

state = "Started"
traces = {"Baseband.TraceEnabled": "yes", "Baseband.TraceHighThroughput": "yes" if high else "no",
          "SystemLogs.TraceMode": "lite"}
workers = concurrent.futures.ThreadPoolExecutor()
one_at_a_time = threading.Lock()


def save_traces():
    """Leaves what velltool goes by while the manager is down: the properties and the live trace."""
    os.makedirs(LIVE_TRACES + ("QDSS.scratch" if high else "DIAG.scratch"), exist_ok=True)
    os.makedirs(os.path.dirname(SAVED_TRACES), exist_ok=True)
    with open(SAVED_TRACES + ".new", "w", encoding="utf-8") as file:
        file.writelines(f'{name}="{value}"\n' for name, value in traces.items())
    os.replace(SAVED_TRACES + ".new", SAVED_TRACES)


def user_agrees():
    """STAND-IN: here a manager asks the user of the device, who may take minutes to answer."""
    return True


def collect(request):
    """Makes a collection, which gets its name when it is complete. Returns its timestamp."""
    with one_at_a_time:
        time.sleep(0.001)  # So no two are equal. In UTC, no hour comes twice.
        now = datetime.datetime.now(datetime.timezone.utc)
    timestamp = now.strftime("%Y-%m-%d-%H-%M-%S-%f")[:-3]
    os.makedirs(COLLECTIONS, exist_ok=True)
    with tempfile.TemporaryDirectory(prefix=".", dir=COLLECTIONS) as work:
        made = [f"log-bb-{timestamp}{ending}" for ending in FOLDERS[request["TraceAction"]]]
        for folder in made:
            os.mkdir(f"{work}/{folder}")
            with open(f"{work}/{folder}/reason.txt", "w", encoding="utf-8") as file:
                file.write(request.get("TraceDumpStateReason") or request["BasebandResetReason"])
        packing = request.get("TraceDumpStatePerformCompression")
        if packing in (1, 2):
            archive = f"log-bb-{timestamp}" + (".tar.gz" if packing == 1 else ".tar")
            with tarfile.open(f"{work}/{archive}", "w:gz" if packing == 1 else "w") as tar:
                for folder in made:
                    tar.add(f"{work}/{folder}", folder)
            made = [archive]
        for entry in made:
            os.rename(f"{work}/{entry}", COLLECTIONS + entry)
    return timestamp


def answer(invocation, command, request):
    """Replies to a command, whatever happens."""
    status, message, reply = FAILED, f"{command} is unknown, or what it is asked about", {}
    trace = f"{request.get('TraceName')}.{request.get('TracePropertyName')}"
    try:
        if command == "GetTraceProperty" and trace in traces:
            status, reply = 0, {"TracePropertyValue": GLib.Variant("s", traces[trace])}
        elif command == "TraceDumpState" and state != "Started":
            status, message = NOT_RUNNING, f"the manager is {state}"
        elif command == "TraceDumpState" and request.get("TraceAction") in FOLDERS:
            if request.get("TraceUserConfirmation", True) and not user_agrees():
                message = "the user has declined"
            else:
                status, reply = 0, {"TimestampString": GLib.Variant("s", collect(request))}
    except Exception as error:
        message = str(error)
    invocation.return_value(GLib.Variant("(isv)", (status, message, GLib.Variant("a{sv}", reply))))


def called(_bus, _sender, _object, _interface, method, arguments, invocation):
    if method == "OpenClient":
        invocation.return_value(None)
    elif arguments[0] == "TraceDumpState" and state == "Started":
        workers.submit(answer, invocation, *arguments)  # Meanwhile the state can be read.
    else:
        answer(invocation, *arguments)


def stop():
    global state
    state = "Stopping"
    payload = GLib.Variant("a{sv}", {"ServerState": GLib.Variant("s", state)})
    bus.emit_signal(None, OBJECT, NAME, "Event", GLib.Variant("(sv)", ("ServerStateChange", payload)))
    threading.Thread(target=lambda: (workers.shutdown(), loop.quit())).start()


def switch_trace():
    traces["Baseband.TraceEnabled"] = "no" if traces["Baseband.TraceEnabled"] == "yes" else "yes"
    save_traces()
    return GLib.SOURCE_CONTINUE


loop = GLib.MainLoop()
bus = Gio.bus_get_sync(Gio.BusType.SYSTEM)
# The object is there before the name is: the first thing that a client does is to ask it.
bus.register_object(OBJECT, Gio.DBusNodeInfo.new_for_xml(INTERFACE).interfaces[0], called,
                    lambda *_: GLib.Variant("s", state))
Gio.bus_own_name_on_connection(bus, NAME, Gio.BusNameOwnerFlags.DO_NOT_QUEUE,
                               lambda *_: (save_traces(), print(NAME, "is on the bus", flush=True)),
                               lambda *_: sys.exit(NAME + " has another owner, or the bus is gone"))
for number, act in (signal.SIGTERM, stop), (signal.SIGINT, stop), (signal.SIGUSR1, switch_trace):
    GLib.unix_signal_add(GLib.PRIORITY_DEFAULT, number, act)
loop.run()
bus.flush_sync()
print(NAME, "has ended")
