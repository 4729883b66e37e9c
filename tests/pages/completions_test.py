"""Types beginnings of command lines into a real bash or zsh, has it insert every completion of the
last word, runs the line, and compares the words that velltool would have got."""

import contextlib
import os
import pty
import signal
import sys
import tempfile
import threading

FILES = ["a log.txt", "other"]
COLLECT = ["--", "nocompress", "tar", "tar.gz"]
ROWS = [
    ("", ["help", "logdump"]),
    ("lo", ["logdump"]),
    ("logdump ", ["bb", "core", "help", "oslog", "tel"]),
    ("logdump bb ", COLLECT),
    ("logdump tel NonUI tar.", ["tar.gz"]),
    ("logdump core ", COLLECT + ["nonui"]),
    ("logdump core tar why ", ["--"]),
    ("logdump tel tarred t", ["t"]),
    ("logdump oslog ", []),
    ("logdump oslog 60 ", FILES),
    ("logdump oslog 60 f ", ["--", "-i", "-p"]),
    ("logdump oslog 60 f -p -", ["--", "-i", "-p"]),
    ("logdump oslog 60 f -i C -p ", ["$(touch hit)", "LinkwardMobileHelper", "init"]),
    ("logdump oslog 60 f -p A -i a", ["a log.txt"]),
    ("logdump tel -- logdump oslog 60 f -p Link", ["LinkwardMobileHelper"]),
]
START = {
    "bash": """bash --norc --noprofile -i
        source '{data}/velltool.bash'
        bind '"\\C-t": insert-completions'
        velltool() {{ printf '%s\\n' "$@" >../words; }}""",
    "zsh": """zsh -f -i
        fpath=(.. $fpath); autoload -U compinit; compinit -u -D
        zle -C all complete-word _generic; bindkey '^T' all
        zstyle ':completion:all:*' completer _all_matches _complete; zstyle ':completion:all:*' insert yes
        velltool() {{ print -rl -- "$@" >../words }}""",
}


def make_place(place, data):
    """The folder to type in, with two files, and beside it a process table and what zsh loads."""
    os.mkdir(place + "/here")
    for name in FILES:
        open(f"{place}/here/{name}", "w").close()
    os.mkfifo(place + "/words")
    os.symlink(data + "/velltool.zsh", place + "/_velltool")
    for process, comm in enumerate(("init", "LinkwardMobileH", "$(touch hit)")):
        os.makedirs(f"{place}/proc/{process}")
        with open(f"{place}/proc/{process}/comm", "w") as file:
            file.write(comm + "\n")
    os.symlink("/usr/libexec/LinkwardMobileHelper", place + "/proc/1/exe")


def drain(terminal):
    with contextlib.suppress(OSError):
        while os.read(terminal, 4096):
            pass


def main(shell, data):
    with tempfile.TemporaryDirectory() as place:
        make_place(place, data)
        command, *setup = START[shell].format(data=data).split("\n")
        child, terminal = pty.fork()
        if child == 0:
            os.chdir(place + "/here")
            os.environ.update(VELL_SYSROOT=place, TERM="dumb", HOME=place)
            os.execvp(command.split()[0], command.split())
        threading.Thread(target=drain, args=(terminal,), daemon=True).start()
        os.write(terminal, "\n".join(setup + [""]).encode())
        for typed, completions in ROWS:
            os.write(terminal, f"velltool {typed}\x14\n".encode())
            with open(place + "/words") as words:
                got = words.read().split("\n")[:-1]
            kept = typed.split(" ")[:-1]
            assert got[:len(kept)] == kept and sorted(got[len(kept):]) == sorted(completions), \
                f"{shell}: {typed!r} becomes {got}"
        assert sorted(os.listdir(place + "/here")) == FILES, "a name of a process was run"
        os.kill(child, signal.SIGKILL)
        os.waitpid(child, 0)


main(*sys.argv[1:])
