# Runs vell-manager-check on managers that keep all promises, and on ones with one fault each, and
# compares what it finds. Looks up in the page each promise that it names.

import concurrent.futures
import re
import subprocess
import sys

DEVICE = ("RADIO_TYPE=1\nJOURNAL=no\nRADIO_DIAG_QDSS=yes\nBaseband.TraceEnabled=lite\n"
          "Baseband.TraceHighThroughput=010\nSystemLogs.TraceMode=no\n")
ENABLED, HIGH, MODE = [f"{name} can be read" for name in (
    "Baseband.TraceEnabled", "Baseband.TraceHighThroughput", "SystemLogs.TraceMode")]
ON_DISK = [f"{what}, {how}, is on disk" for what in ("tel", "core", "bb")
           for how in ("not packed", "as a tar.gz", "as a tar")]
ALL = ON_DISK + ["a reason of 100 kB is taken", "a reason of odd characters is taken",
                 "two collections at a time differ"]
UNKNOWN = "what is unknown is answered"
CHECK = ["vell-manager-check", "--collect=3"]
# Further lines of the device's profile, and what is found on its manager.
PROFILES = [
    ("RADIO_VENDOR=2", []), ("SystemLogs.TraceMode=0x3", []),
    ("SERVER_STATE=started", ["the manager starts"]),
    ("SERVER_STATE_TYPE=integer", ["the manager starts", "the state is a string, and comes at once",
                                   "introspection is right"]),
    ("GET_TRACE_PROPERTY.SystemLogs.TraceMode=silent", [MODE]),
    ("GET_TRACE_PROPERTY=wrong-signature", [ENABLED, HIGH, MODE, UNKNOWN]),
    ("GET_TRACE_PROPERTY=no-dictionary", [ENABLED, HIGH, MODE]),
    ("GET_TRACE_PROPERTY.Baseband.TraceEnabled=status:0xE020E001", [ENABLED]),
    ("GET_TRACE_PROPERTY.SystemLogs.TraceMode=die", [MODE]),
    ("Baseband.TraceEnabled_TYPE=integer", [ENABLED]), ("SystemLogs.TraceMode=3x", [MODE]),
    ("SAVED_TRACES=no", ["the saved traces agree"]),
    ("TRACE_DUMP_STATE.CollectBasebandLogs=restart", [ON_DISK[6]]),
    ("TRACE_DUMP_STATE.CollectTelephonyLogsWithCoredump=silent", [ON_DISK[3]]),
    ("TRACE_DUMP_STATE=status:5", ALL), ("TIMESTAMP_TYPE=integer", ALL), ("TIMESTAMP=", ALL)]
# What in the example becomes what, and what is found on that manager.
CHANGES = [
    ("", "", []), ('access="read"', 'access="readwrite"', ["introspection is right"]),
    ("bus.register_object(", "GLib.timeout_add(200, bus.register_object, ",
     ["the object is there before the name"]),
    ("    invocation.return_value(GLib", "    status == 1 or invocation.return_value(GLib", [UNKNOWN]),
    ("save_traces(), ", "", ["the saved traces agree", "the live traces are there"]),
    ('"w:gz" if', '"w" if', ON_DISK[1::3]), ('"-qdss"', '"-diag"', [ON_DISK[6]]),
    ("    return timestamp", "    threading.Timer(.2, os.utime, [COLLECTIONS + made[0]]).start()\n    return timestamp",
     ["what is replied to is complete"]),
    ("workers.submit(", "arguments[1].get('BasebandResetType') and time.sleep(.6); workers.submit(",
     ["the state comes at once during a collection"]),
    ('Variant("s", state)})', 'Variant("s", "Stopped")})', ["state, property and event agree"])]
MOCK = ["vell-manager-check", "--", "python3", "-m", "dbusmock", "-t", "doc/examples/vell_manager.py"]
with open("doc/examples/manager.py") as file:
    EXAMPLE = file.read()
with open("doc/writing-a-manager.md") as file:
    PAGE = [" ".join(part.split()) for part in re.split(r"^#+ (.*)\n", file.read(), flags=re.MULTILINE)]
# A device without what a manager leaves on one.
BARE = ["sh", "-c", 'rm -r "$VELL_SYSROOT"/private "$VELL_SYSROOT"/var/lib/vell; exec "$@"', "sh"]
RUNS = [(lines, CHECK, found) for lines, found in PROFILES]
RUNS += [("MANAGER=absent", [*BARE, *CHECK, "--", "python3", "-c", EXAMPLE.replace(old, new)], found)
         for old, new, found in CHANGES if old in EXAMPLE or sys.exit(old)]
RUNS += [("MANAGER=absent", [*CHECK, "--", "vell-simulator", "--serve", "manager"], []),
         (DEVICE.replace("lite", "yes").replace("010", "yes").replace("=no", "=yes") + "MANAGER=absent", MOCK, [])]


def run(lines, words, expected):
    shell = ["bash", "-c", 'exec vell-simulator <(echo "$0") -- "$@"', DEVICE + lines]
    ended = subprocess.run(shell + words, capture_output=True, text=True)
    found = re.findall("^not ok \\d+ - (.*)$", ended.stdout, re.MULTILINE)
    for promised, heading in re.findall("^# promised: (.*)\n# heading: (.*)$", ended.stdout, re.MULTILINE):
        assert promised in PAGE[PAGE.index(heading) + 1], promised
    # How soon an answer comes is up to a busy machine, too.
    sure = [name for name in found if "at once" not in name or name in expected]
    right = (sure, ended.returncode, "1..28\n" in ended.stdout) == (expected, bool(found), True)
    assert right, f"{lines}: not {expected}\n{ended.stdout}{ended.stderr}"


with concurrent.futures.ThreadPoolExecutor(6) as threads:
    for outcome in [threads.submit(run, *each) for each in RUNS]:
        outcome.result()
