#!/usr/bin/python3
# Plays velltool against a manager, and prints as TAP which promises of the page "Writing a manager"
# that manager keeps; vell-manager-check(1) is the manual page.
#
# All waiting is done in `wait`, which has a limit; the bus library calls back from there.

import argparse
import atexit
import contextlib
import glob
import os
import re
import shlex
import signal
import subprocess
import sys
import tarfile
import time
from xml.etree import ElementTree

try:
    from gi.repository import Gio, GLib
    from gi.repository.GLib import Variant
except ImportError:
    sys.exit("vell-manager-check: install python3-gi")

NAME, OBJECT = "org.vell.Manager1", "/org/vell/Manager1"
BUS, PROPERTIES = "org.freedesktop.DBus", "org.freedesktop.DBus.Properties"
INTERFACE = {"OpenClient": "method in s", "ServerState": "property read s", "Event": "signal s v",
             "PerformCommand": "method in s in a{sv} out i out s out v"}
COLLECTIONS = "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-"
LIVE_TRACES = "/private/var/wireless/Library/Logs/VellManager/"
ENABLED, HIGH, MODE = "Baseband.TraceEnabled", "Baseband.TraceHighThroughput", "SystemLogs.TraceMode"
PACKED = {1: ".tar.gz", 2: ".tar"}
WORDS = {"false": 0, "off": 0, "no": 0, "true": 1, "on": 1, "yes": 1, "full": 1, "lite": 2}
ODD_KEYS = {"Zone": Variant("(si)", ("a", 1)), "": Variant("aay", [b"\xff"]),
            "Inner": Variant("a{sv}", {"TraceName": Variant("s", "SystemLogs")})}

# In seconds: how long velltool waits for the state, and how long this program does for other things.
QUICK, PATIENCE, PATIENCE_WITH_COMMAND = 0.5, 5, 10

LAST = "state, property and event agree"  # in the end of the manager, too

root = os.environ.get("VELL_SYSROOT", "")


# There is nothing to see a promise by: why.
class Skipped(Exception):
    pass


def expect(condition, otherwise, kind=ValueError):
    if not condition:
        raise kind(otherwise)


def bail(reason):
    print("Bail out!", *str(reason).split(), flush=True)
    sys.exit(2)


# Serves the bus until `done()` holds, at most `limit` seconds. Returns what it is then.
def wait(done, limit):
    end = time.monotonic() + limit
    tick = GLib.timeout_add(10, lambda: True)
    while not done() and time.monotonic() < end:
        GLib.MainContext.default().iteration(True)
    GLib.source_remove(tick)
    return done()


def connect():
    ready, flags = [], Gio.DBusConnectionFlags
    address = Gio.dbus_address_get_for_bus_sync(Gio.BusType.SYSTEM)
    Gio.DBusConnection.new_for_address(address, flags.AUTHENTICATION_CLIENT | flags.MESSAGE_BUS_CONNECTION,
                                       None, None, lambda _, result: ready.append(result))
    wait(lambda: ready, PATIENCE) or bail(f"the bus does not answer in {PATIENCE} s")
    return Gio.DBusConnection.new_for_address_finish(ready[0])


# A file in the syntax of os-release(5).
def settings(path):
    with open(root + path, encoding="utf-8", errors="replace") as file:
        text = file.read()
    with contextlib.suppress(ValueError):
        return dict(word.split("=", 1) for word in shlex.split(text, comments=True) if "=" in word)
    raise ValueError(f"{root}{path} is not in the syntax of os-release(5): {text}")


# The value of a trace property as velltool reads it; None where it is missing or cannot be read.
def number(value):
    for base in 0, 8:
        with contextlib.suppress(AttributeError, ValueError):
            return WORDS[value.lower()] if value.lower() in WORDS else int(value, base)


# The files at and below a path, each with its size and time.
def sizes(path):
    paths = [path] + [os.path.join(folder, name) for folder, _, names in os.walk(path) for name in names]
    return {entry: (os.lstat(entry).st_size, os.lstat(entry).st_mtime_ns) for entry in paths}


# A method call under way. It ends after `limit` seconds at the latest.
class Call:
    def __init__(self, client, member, body, interface=NAME, limit=PATIENCE, then=lambda reply: None):
        self.member, self.limit, self.then, self.start = member, limit, then, time.monotonic()
        self.reply = self.error = self.took = None
        client.call(NAME, OBJECT, interface, member, body, None, Gio.DBusCallFlags.NO_AUTO_START,
                    int(limit * 1000), None, self.ended)

    def ended(self, client, result):
        self.took = time.monotonic() - self.start
        try:
            self.reply = client.call_finish(result)
            self.then(self.reply)
        except GLib.Error as error:
            self.error = error

    # The error that the manager has answered with, if any. Silence breaks a promise.
    def refusal(self):
        wait(lambda: self.took, self.limit + 1)
        silent = self.error and self.error.matches(Gio.io_error_quark(), Gio.IOErrorEnum.TIMED_OUT)
        expect(self.took and not silent, f"no answer to {self.member} in {self.limit} s")
        return self.error

    # The values of the reply, which has to have that signature.
    def values(self, signature):
        expect(not self.refusal(), f"{self.member} is answered with {self.error and self.error.message}")
        expect(self.reply.get_type_string() == signature,
               f"{self.member} is answered with {self.reply.get_type_string()} {self.reply}")
        return [self.reply.get_child_value(place) for place in range(self.reply.n_children())]

    def state(self):
        value = self.values("(v)")[0].get_variant()
        expect(value.get_type_string() == "s", f"the state is {value.get_type_string()} {value}")
        return value.get_string()

    # The status, and with status 0 the value of that key, if there is one.
    def status(self, key):
        status, _, reply = self.values("(isv)")
        status, reply = status.get_int32(), reply.get_variant()
        expect(status != 0 or reply.get_type_string() == "a{sv}", f"{self.member} is answered with {self.reply}")
        value = reply.lookup_value(key, None) if status == 0 else None
        expect(value is None or value.get_type_string() == "s", f"{self.member} is answered with {self.reply}")
        return status, None if value is None else value.get_string()


# The manager, with two clients of it and what they have seen.
class Manager:
    def __init__(self, command):
        self.client, self.other = connect(), connect()
        self.process = self.owner = self.first = self.early = self.unanswered = None
        self.history = [("start", "never read")]  # Then ("event" or "property", state), as they came.
        self.properties, self.timestamps, self.files, self.slowest, self.late = {}, set(), {}, 0, False
        self.client.connect("closed", lambda *_: setattr(self, "owner", None) or bail("the bus is gone"))
        self.client.signal_subscribe(BUS, BUS, "NameOwnerChanged", None, NAME, 0, self.owner_changed)
        self.client.signal_subscribe(None, NAME, None, OBJECT, None, 0, self.event_came)
        with contextlib.suppress(GLib.Error):
            self.owner, = self.client.call_sync(
                BUS, "/org/freedesktop/DBus", BUS, "GetNameOwner", Variant("(s)", (NAME,)), None, 0, 5000, None)
        bool(self.owner) != bool(command) or bail(f"{NAME} has an owner already" if command else f"nobody owns {NAME}")
        if command:
            self.process = subprocess.Popen(command, stdout=sys.stderr, start_new_session=True)
            atexit.register(self.end, signal.SIGKILL)
            wait(lambda: self.owner or self.process.poll() is not None, PATIENCE_WITH_COMMAND)
            self.owner or bail(f"COMMAND has ended, or does not own {NAME} after {PATIENCE_WITH_COMMAND} s")

    # Ends the command, if it has not ended. What the manager does meanwhile goes into the history.
    def end(self, number):
        with contextlib.suppress(ProcessLookupError):
            os.killpg(self.process.pid, number)
        GLib.timeout_add(20, lambda: bool(self.owner and self.read_state()))
        return wait(lambda: self.process.poll() is not None and not self.owner, PATIENCE_WITH_COMMAND)

    def owner_changed(self, _bus, _sender, _object, _interface, _signal, values):
        self.owner = values[2]
        if self.owner:
            Call(self.client, "OpenClient", Variant("(s)", ("velltool",)))
            self.first, self.early = self.read_state(), self.ask(ENABLED)

    def event_came(self, _bus, sender, _object, _interface, member, values):
        fits = values.get_type_string() == "(sv)" and values.get_child_value(1).get_variant().is_of_type(
            GLib.VariantType("a{sv}"))
        if sender == self.owner and (not fits or values[0] == "ServerStateChange"):
            self.history.append(("event", fits and values[1].get("ServerState") or f"{member} {values}"))
            self.read_state()

    # Reads the state. What the first client reads goes into the history.
    def read_state(self, client=None):
        return Call(client or self.client, "Get", Variant("(ss)", (NAME, "ServerState")), PROPERTIES,
                    then=lambda reply: client or self.history.append(("property", str(*reply.unpack()[:1]))))

    def perform(self, command, client=None, limit=PATIENCE, **request):
        entries = {key: value if isinstance(value, Variant) else Variant("s", value)
                   for key, value in request.items()}
        return Call(client or self.client, "PerformCommand", Variant("(sa{sv})", (command, entries)), limit=limit)

    def ask(self, name, client=None, **more):
        trace, point = name.split(".")
        return self.perform("GetTraceProperty", client, TraceName=trace, TracePropertyName=point, **more)

    # Asks for a collection in velltool's words.
    def collect(self, what, packing, client=None, reason="User triggered", **more):
        expect(arguments.collect, "without --collect", Skipped)
        expect(not self.unanswered, "another collection was not answered", Skipped)
        expect(what != "bb" or number(self.properties.get(ENABLED)), "baseband logs are not enabled", Skipped)
        expect(what == "bb" or self.history[-1][1] == "Started", "the state is not Started", Skipped)
        packing = 0 if what != "core" and number(self.properties.get(MODE)) == 3 else packing
        reason, packed = "[velltool] " + reason, {"TraceDumpStatePerformCompression": Variant("x", packing)}
        quiet = {**packed, "TraceUserConfirmation": Variant("b", False)}
        request = {
            "tel": {"TraceAction": "CollectTelephonyLogs", "TraceDumpStateReason": reason, **quiet},
            "core": {"BasebandResetType": "Hard", "BasebandResetSubType": "OtherErrors",
                     "TraceAction": "CollectTelephonyLogsWithCoredump", "BasebandResetReason": reason, **quiet},
            "bb": {"TraceDumpStateReason": reason, "TraceAction": "CollectBasebandLogs", **packed}}[what]
        call = self.perform("TraceDumpState", client, arguments.collect, **request, **more)
        call.ending, call.asked = PACKED.get(packing) or self.ending(what), self.ask(ENABLED, self.other, limit=arguments.collect)
        return call

    # The end of the name of a collection that is not packed, or of the live traces.
    def ending(self, what):
        vendor2 = number(profile.get("RADIO_VENDOR")) == 2
        high = profile.get("RADIO_DIAG_QDSS") == "yes" and number(self.properties.get(HIGH))
        return {"tel": "-*", "core": "-coredump" if vendor2 else "-cd", "live": "QDSS" if high else "DIAG",
                "bb": "-bb-trace" if vendor2 else "-qdss" if high else "-diag"}[what]

    # Waits for a collection, reads the state meanwhile as other velltools do, and looks at what is made.
    def finish(self, call):
        self.unanswered, asked = call, call.asked
        while not call.took:
            read = self.read_state(self.other)
            wait(lambda: call.took, 0.05)
            wait(lambda: read.took, PATIENCE + 1)
            self.slowest = max(self.slowest, read.took)
        call.refusal()
        self.late |= call.took > QUICK and not (asked.took and asked.start + asked.took < call.start + call.took)
        self.unanswered = None
        status, timestamp = call.status("TimestampString")
        expect(status == 0 and re.fullmatch(r"[A-Za-z0-9._-]+", timestamp or ""), call.reply)
        expect(timestamp not in self.timestamps, f"the timestamp {timestamp} a second time")
        self.timestamps.add(timestamp)
        path = glob.escape(root) + COLLECTIONS + timestamp
        found = glob.glob(path + call.ending)
        is_right = os.path.isfile if call.ending in PACKED.values() else os.path.isdir
        expect(found and all(map(is_right, found)), f"in place of {path}{call.ending}: {glob.glob(path + '*')}")
        if call.ending in PACKED.values():
            with tarfile.open(found[0], "r:gz" if call.ending == ".tar.gz" else "r:") as archive:
                archive.getmembers()
                archive.fileobj.read()
        self.files.update({entry: sizes(entry) for entry in found})


# The members of the manager's interface in its introspection, in the form of INTERFACE.
def members_of(xml):
    members = ElementTree.fromstring(xml).findall(f"interface[@name='{NAME}']/*")
    return {member.get("name"): " ".join(filter(None, [member.tag, member.get("access"), member.get("type")] + [
        word for arg in member.iter("arg")
        for word in (member.tag == "method" and arg.get("direction", "in"), arg.get("type"))])) for member in members}


# Around what sees whether a promise is kept: prints the outcome.
@contextlib.contextmanager
def promise(what, heading, words):
    owner, came, skipped = manager.owner, None, ""
    try:
        yield
        expect(manager.owner == owner or what == LAST, "the manager has ended")
    except Skipped as reason:
        skipped = f" # SKIP {reason}"
    except Exception as error:
        came = " ".join(str(error).split())[:400]  # In one line of TAP.
    if came and not owner:
        came, skipped = None, " # SKIP the manager has ended"
    results.append(not came)
    finding = f"\n# came: {came}\n# promised: {words}\n# heading: {heading}"
    print(f"not ok {len(results)} - {what}{finding}" if came else f"ok {len(results)} - {what}{skipped}", flush=True)


def run():
    members, commands, down = "The manager's members", "TraceDumpState", "While the manager is down"
    client, other = manager.client, manager.other
    with promise("the object is there before the name", members, "Have the object there before you own the name"):
        expect(manager.first, "the manager ran before", Skipped)
        manager.first.values("(v)")
    with promise("the manager starts", "States and events",
                 "`ServerState` is `Started` when the manager can carry out commands"):
        wait(lambda: not manager.read_state().refusal() and manager.history[-1][1] == "Started",
             PATIENCE_WITH_COMMAND if manager.process else 0)
        expect(manager.history[-1][1] == "Started", f"the state {manager.history[-1][1]}")
    with promise("the state is a string, and comes at once", members, "`Get` must always be quick"):
        (read := manager.read_state()).state()
        expect(read.took <= QUICK, f"the state after {read.took:.1f} s")
    with promise("introspection is right", members, "Answer `Introspect` as the interface file has it"):
        found = members_of(Call(client, "Introspect", None, BUS + ".Introspectable").values("(s)")[0].get_string())
        expect(INTERFACE.items() <= found.items(), found)
    with promise("OpenClient needs no answer", members, "looks at no answer and waits for none"):
        opened = Call(other, "OpenClient", Variant("(s)", ("velltool",)))
        manager.read_state(other).refusal()
        expect(not opened.error, f"an error: {opened.error and opened.error.message}")
    for name in ENABLED, HIGH, MODE:
        with promise(f"{name} can be read", "GetTraceProperty",
                     "The value is one of these words, in any letter case, or a number"):
            for call in filter(None, [name == ENABLED and manager.early, manager.ask(name)]):
                status, value = call.status("TracePropertyValue")
                expect(name != ENABLED or value is not None, f"status {status} and no value")
            expect(value is None or number(value) is not None, f"the value '{value}'")
            manager.properties[name] = value
    with promise("what is unknown is answered", members, "Answer each command, also one that you do not know"):
        for call in (manager.ask("Baseband.NoSuchProperty"), manager.ask("NoSuchTrace.TraceEnabled"),
                     manager.perform("NoSuchCommand"), manager.perform("GetTraceProperty")):
            expect(call.refusal() or call.values("(isv)"), "nothing")
        for names in (NAME, "NoSuchProperty"), ("org.vell.NoSuch1", "ServerState"):
            expect(Call(client, "Get", Variant("(ss)", names), PROPERTIES).refusal(), f"a value of {names}")
    with promise("unknown keys are skipped", members, "skip those that you do not know, whatever type they have"):
        few, more = [str(call.refusal() or call.reply) for call in (manager.ask(ENABLED), manager.ask(ENABLED, **ODD_KEYS))]
        expect(few == more, f"in place of {few}, {more}")
    with promise("the saved traces agree", down, "Have each property there with the value that you answer"):
        saved = settings("/var/lib/vell/traces.conf")
        for name, value in manager.properties.items():
            expect(value in (None, saved.get(name)), f"{name} is answered {value}, and saved {saved.get(name)}")
    with promise("the live traces are there", down, "`bb` finds what it left, if it left two things"):
        expect(number(manager.properties.get(ENABLED)), "baseband logs are not enabled", Skipped)
        live = f"{root}{LIVE_TRACES}{manager.ending('live')}.scratch"
        expect(os.path.isdir(live), f"no directory {live}")
    with promise("two clients at a time are answered", members, "several may run at a time"):
        answers = {str(call.refusal() or call.reply) for call in [manager.ask(ENABLED, of) for of in [client, other] * 5]}
        expect(len(answers) == 1, f"different answers: {answers}")
    for what in "tel", "core", "bb":
        for packing, how in (0, "not packed"), (1, "as a tar.gz"), (2, "as a tar"):
            with promise(f"{what}, {how}, is on disk", commands,
                         "Reply when the collection is complete on disk, under its name"):
                manager.finish(manager.collect(what, packing))
    for kind, reason in ("100 kB", "x" * 100000), ("odd characters", "../a b\"'`$(exit)%s\\\n\x01\ufffd\U0001f4f1"):
        with promise(f"a reason of {kind} is taken", commands, "It is any text of any length"):
            manager.finish(manager.collect("tel", 0, reason=reason, **ODD_KEYS))
    with promise("two collections at a time differ", commands, "Each collection has one that no other has"):
        for call in [manager.collect("tel", 0, each) for each in (client, other)]:
            manager.finish(call)
    with promise("what is replied to is complete", commands, "Reply when the collection is complete on disk"):
        expect(manager.files, "nothing was collected", Skipped)
        wait(lambda: False, QUICK)
        late = [entry for entry, before in manager.files.items() if sizes(entry) != before]
        expect(not late, f"after the reply, there were changes in {late}")
    with promise("the state comes at once during a collection", members, "answer later, and serve other calls meanwhile"):
        expect(manager.slowest, "nothing was collected", Skipped)
        expect(manager.slowest <= QUICK and not manager.late, f"{manager.slowest:.1f} s, other calls held up: {manager.late}")
    with promise(LAST, "States and events", "change the property, then send `Event`"):
        if manager.process and not manager.end(signal.SIGTERM):
            print(f"# COMMAND runs {PATIENCE_WITH_COMMAND} s after SIGTERM, and is killed")
        told = [("property", state) for kind, state in manager.history if kind == "event"]
        for (kind, state), (next_kind, next_state) in zip(manager.history, manager.history[1:]):
            expect(kind == "start" or next_kind == "event" or next_state == state or (kind, next_state) in told,
                   f"{kind} {state}, then {next_kind} {next_state}")


parser = argparse.ArgumentParser(usage="%(prog)s [--collect[=SECONDS]] [-- COMMAND...]", allow_abbrev=False)
parser.add_argument("--collect", nargs="?", type=float, const=120)
parser.add_argument("command", nargs="*")
arguments = parser.parse_args()
arguments.collect is None or 1 <= arguments.collect <= 86400 or parser.error("SECONDS is a number from 1 to 86400")
for number_of_signal in signal.SIGINT, signal.SIGTERM:
    signal.signal(number_of_signal, lambda received, _: bail(signal.Signals(received).name))
results = []  # of each promise, whether it is kept
try:
    manager = Manager(arguments.command)
    profile = settings("/etc/vell/device.conf")
except (GLib.Error, OSError, ValueError) as error:
    bail(error)
run()
print(f"1..{len(results)}")
sys.exit(not all(results))
