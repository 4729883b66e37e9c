"""Types beginnings of command lines into a real bash or zsh, has it insert every completion of the
last word, runs the line, and compares the words that velltool would have got."""

import os
import subprocess
import sys
import tempfile

COLLECT = ["--", "nocompress", "tar", "tar.gz"]
ROWS = [
    ("", ["help", "logdump"]),
    ("logdump ", ["bb", "core", "help", "oslog", "tel"]),
    ("logdump bb ", COLLECT),
    ("logdump tel NonUI tar.", ["tar.gz"]),
    ("logdump core ", COLLECT + ["nonui"]),
    ("logdump tel tar tarred ", ["--"]),
    ("logdump oslog ", []),
    ("logdump oslog 60 ", ["a log.txt", "other"]),
    ("logdump oslog 60 f ", ["--", "-i", "-p"]),
    ("logdump oslog 60 f -p -", ["--", "-i", "-p"]),
    ("logdump oslog 60 f -i C -p ", ["$(touch hit)", "LinkwardMobileHelper", "init"]),
    ("logdump oslog 60 f -p A -i a", ["a log.txt"]),
    ("logdump tel -- logdump oslog 60 f -p Link", ["LinkwardMobileHelper"]),
]
START = {
    "bash": """bash --norc --noprofile -i
        source '{data}/velltool.bash'
        bind '"\\C-t": insert-completions'""",
    "zsh": """zsh -f -i
        fpath=(.. $fpath); autoload -U compinit; compinit -u -D
        zle -C all complete-word _generic; bindkey '^T' all
        zstyle ':completion:all:*' completer _all_matches _complete; zstyle ':completion:all:*' insert yes""",
}
STUB = """velltool() { printf '%s\\n' "$@" '' >>../words; }"""
# The folder to type in, with two files, and beside it a process table and what zsh loads.
PLACE = """mkdir -p here proc/0 proc/1 proc/2
    touch here/other 'here/a log.txt'
    echo init >proc/0/comm
    echo LinkwardMobileH >proc/1/comm
    ln -s /usr/libexec/LinkwardMobileHelper proc/1/exe
    echo '$(touch hit)' >proc/2/comm
    ln -s "$0/velltool.zsh" _velltool"""


def main(shell, data):
    command, *lines = START[shell].format(data=data).split("\n")
    lines += [STUB, *(f"velltool {typed}\x14" for typed, _ in ROWS), "exit", ""]
    with tempfile.TemporaryDirectory() as place:
        subprocess.run(["sh", "-ec", PLACE, data], cwd=place, check=True)
        with subprocess.Popen(["script", "-qc", command, "/dev/null"], cwd=place + "/here",
                              env=dict(os.environ, VELL_SYSROOT=place, TERM="dumb", HOME=place),
                              stdin=subprocess.PIPE, stdout=subprocess.DEVNULL,
                              bufsize=0) as terminal:
            terminal.stdin.write("\n".join(lines).encode())
            terminal.wait()
        with open(place + "/words") as words:
            entered = [line.split("\n") for line in words.read().split("\n\n")[:-1]]
        for (typed, completions), got in zip(ROWS, entered, strict=True):
            kept = typed.split(" ")[:-1]
            assert sorted(got) == sorted(kept + completions), f"{shell}: {typed!r} becomes {got}"
        assert not os.path.exists(place + "/here/hit"), "a name of a process was run"


main(*sys.argv[1:])
