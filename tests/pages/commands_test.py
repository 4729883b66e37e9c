"""Types the command lines of a page into a shell on a simulated device: what stands behind "$ ", or
"> " where a line goes on, and behind a prompt of velltool's. Compares what comes with what the page
shows below, times aside."""

import os
import re
import subprocess
import sys
import tempfile

TIME = re.compile(r"\d{4}-\d\d-\d\d[- ]\d\d[-:]\d\d[-:]\d\d(-\d{3})?|\d+\.\d+s\b")
COMMAND = re.compile(r"^\$ (.*(?:\n> .*)*)\n((?:(?!\$ |```).*\n)*)", re.MULTILINE)
PROMPT = re.compile(r"^(\(/[\w/]+\)>> )(.*\n)", re.MULTILINE)


def read_page(path):
    """The text of a page; "```" is around what is shown as it is."""
    if path.endswith(".md"):
        with open(path) as page:
            return page.read()
    text = subprocess.run(["mandoc", "-T", "ascii", path], check=True, capture_output=True, text=True)
    lines = re.sub(".\b", "", text.stdout).splitlines()
    return "\n".join(line.strip() or "```" for line in lines)


def run(shell, command, typed, lines):
    """What the command prints, colours aside; of one in the background, as many lines as are shown."""
    here = f" <<'TYPED'\n{typed}TYPED" if typed else ""
    shell.stdin.write(f"{command}{here}\nstatus=$?; printf '\\1'; (exit $status)\n".encode())
    output = b""
    while b"\1" not in output or (command.endswith("&") and output.count(b"\n") < lines):
        output += shell.stdout.read(4096) or sys.exit(f"{command}: the shell has ended\n{output}")
    return re.sub(r"\x01|\x1b\[\d+m", "", output.decode())


def main(page, programs):
    commands = COMMAND.findall(read_page(page)) or sys.exit()
    environment = dict(os.environ, PATH=programs + ":/usr/sbin:/usr/bin:/sbin:/bin", SHELL="bash")
    with tempfile.TemporaryDirectory() as folder:
        os.symlink(os.getcwd() + "/doc", folder + "/doc")
        with subprocess.Popen(["vell-simulator", "--", "bash"], cwd=folder, env=environment,
                              stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                              stderr=subprocess.STDOUT, bufsize=0) as shell:
            for command, shown in commands:
                typed = "".join(line for _, line in PROMPT.findall(shown))
                expected = PROMPT.sub(r"\1", shown)
                output = run(shell, command.replace("\n> ", "\n"), typed, expected.count("\n"))
                if TIME.sub("TIME", output) != TIME.sub("TIME", expected):
                    sys.exit(f"{page}: $ {command}\nprints:\n{output}and not:\n{expected}")


main(*sys.argv[1:])
