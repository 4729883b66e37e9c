# Runs vell-manager-check on managers that keep all promises, and on ones with one fault each, and
# compares the numbers of the checks that find something. Looks up in the page what each finding quotes.

import concurrent.futures
import re
import subprocess
import sys

DEVICE = ("RADIO_TYPE=1\nJOURNAL=no\nRADIO_DIAG_QDSS=yes\nBaseband.TraceEnabled=lite\n"
          "Baseband.TraceHighThroughput=010\nSystemLogs.TraceMode=no\n")
CHECK = ["vell-manager-check", "--collect=3"]
AT_ONCE = 3, 27  # what is up to a busy machine, too
# Further lines of the device's profile, and what is found on its manager.
PROFILES = {
    "RADIO_VENDOR=2": [], "SystemLogs.TraceMode=0x3": [], "SERVER_STATE=started": [2],
    "SERVER_STATE_TYPE=integer": [2, 3, 4], "GET_TRACE_PROPERTY.SystemLogs.TraceMode=silent": [8],
    "GET_TRACE_PROPERTY=wrong-signature": [6, 7, 8, 9], "GET_TRACE_PROPERTY=no-dictionary": [6, 7, 8],
    "GET_TRACE_PROPERTY.Baseband.TraceEnabled=status:0xE020E001": [6],
    "GET_TRACE_PROPERTY.SystemLogs.TraceMode=die": [8], "Baseband.TraceEnabled_TYPE=integer": [6],
    "SystemLogs.TraceMode=3x": [8], "SAVED_TRACES=no": [11],
    "TRACE_DUMP_STATE.CollectBasebandLogs=restart": [20],
    "TRACE_DUMP_STATE.CollectTelephonyLogsWithCoredump=silent": [17],
    "TRACE_DUMP_STATE=status:5": [*range(14, 26)], "TIMESTAMP_TYPE=integer": [*range(14, 26)],
    "TIMESTAMP='a b'": [*range(14, 26)], "TIMESTAMP=T": [*range(15, 27)]}
# What in the example becomes what, and what is found on that manager.
CHANGES = [
    ("", "", []), ("tion.return_value(None)", "tion.return_dbus_error('a.b', '')", [5]),
    ("<property ", '<property name="NoSuchProperty" type="s" access="read"/><property ', [9]),
    ('== "GetTraceProperty" and', '== "GetTraceProperty" and len(request) == 2 and', [10]),
    ('"s", traces[trace])', '"s", str(time.time_ns()))', [10, 11, 13]),
    ("    with one_at", "    request.get('TraceDumpStateReason', '')[65536:] and int('')\n    with one_at", [23]),
    ("    with one_at", "    request.get('TraceDumpStateReason', '').encode('ascii')\n    with one_at", [24]),
    ("bus.emit_signal(", "workers.submit(time.sleep, .5); print(", [28]),
    ('== "GetTraceProperty" and', '== "GetTraceProperty" and next(globals().setdefault("asked", iter([0])), 1) and', [6]),
    ("    timestamp = now", "    time.sleep(.6)\n    timestamp = now", []),
    ('access="read"', 'access="readwrite"', [4]),
    ("bus.register_object(", "GLib.timeout_add(200, bus.register_object, ", [1, 6]),
    ("    invocation.return_value(GLib", "    status == 1 or invocation.return_value(GLib", [9]),
    ("save_traces(), ", "", [11, 12]), ('"w:gz" if', '"w" if', [15, 18, 21]), ('"-qdss"', '"-diag"', [20]),
    ("    return time", "    threading.Timer(.2, os.utime, [COLLECTIONS + made[0]]).start()\n    return time", [26]),
    ("workers.sub", "arguments[1].get('BasebandResetType') and time.sleep(.6); workers.sub", [27]),
    ('*_: GLib.Variant("s", state)', '*_, first=iter(["Starting"]): GLib.Variant("s", next(first, state))', [28])]
MOCK = ["vell-manager-check", "--", "python3", "-m", "dbusmock", "-t", "doc/examples/vell_manager.py"]
# On a device without what a manager leaves there.
BARE = ["sh", "-c", 'rm -r "$VELL_SYSROOT"/private "$VELL_SYSROOT"/var/lib/vell; exec "$@"', "sh"]
with open("doc/examples/manager.py") as example, open("doc/writing-a-manager.md") as page:
    EXAMPLE, PAGE = example.read(), re.split(r"^#+ (.*)\n", page.read(), flags=re.MULTILINE)
RUNS = [(lines, CHECK, found) for lines, found in PROFILES.items()]
RUNS += [("MANAGER=absent", [*BARE, *CHECK, "--", "python3", "-c", EXAMPLE.replace(old, new)], found)
         for old, new, found in CHANGES if old in EXAMPLE or sys.exit(old)]
RUNS += [("MANAGER=absent", [*CHECK, "--", "vell-simulator", "--serve", "manager"], []),
         (re.sub("lite|010|no$", "yes", DEVICE, flags=re.MULTILINE) + "MANAGER=absent", MOCK, [])]


def run(lines, words, expected):
    shell = ["bash", "-c", 'exec vell-simulator <(echo "$0") -- "$@"', DEVICE + lines]
    ended = subprocess.run(shell + words, capture_output=True, text=True)
    found = [int(number) for number in re.findall("^not ok (\\d+)", ended.stdout, re.MULTILINE)]
    for promised, heading in re.findall("^# promised: (.*)\n# heading: (.*)$", ended.stdout, re.MULTILINE):
        assert promised in " ".join(PAGE[PAGE.index(heading) + 1].split()), promised
    sure = [number for number in found if number not in AT_ONCE or number in expected]
    right = (sure, ended.returncode, "1..28\n" in ended.stdout) == (expected, bool(found), True)
    assert right, f"{lines}: not {expected}\n{ended.stdout}{ended.stderr}"


with concurrent.futures.ThreadPoolExecutor(6) as threads:
    list(threads.map(lambda each: run(*each), RUNS))
