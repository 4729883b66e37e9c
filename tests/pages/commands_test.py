"""Types the command lines of a page into a shell on a simulated device: what stands behind "$ ", or
"> " where a line goes on, and behind a prompt of velltool's. Compares what comes with what the page
shows below, times and names of folders aside."""

import os
import re
import subprocess
import sys
import tempfile

VARIABLE = [
    (r"\d{4}-\d\d-\d\d[- ]\d\d[-:]\d\d[-:]\d\d(-\d{3})?", "TIME"),
    (r"\d+\.\d+s\b", "SECONDS"),
    (r"/tmp/[\w-]+", "FOLDER"),
    (r"\x1b\[\d+m", ""),
]
PROMPT = re.compile(r"(\(/[\w/]+\)>> )(.*)")


def read_page(path):
    """The lines of a page; "```" is around what is shown as it is."""
    if path.endswith(".md"):
        with open(path) as page:
            return page.read().splitlines()
    text = subprocess.run(["mandoc", "-T", "ascii", path], check=True, capture_output=True, text=True)
    lines = re.sub(".\b", "", text.stdout).splitlines()
    return [line.strip() or "```" for line in lines]


def find_commands(lines):
    """Each command line with the input and the output that are shown below it."""
    commands = []
    shown = False
    for line in lines:
        prompt = PROMPT.fullmatch(line)
        if line.startswith("$ "):
            commands.append([line[2:], "", ""])
            shown = True
        elif line.startswith("```"):
            shown = False
        elif shown and line.startswith("> "):
            commands[-1][0] += "\n" + line[2:]
        elif shown and prompt:
            commands[-1][1] += prompt[2] + "\n"
            commands[-1][2] += prompt[1]
        elif shown:
            commands[-1][2] += line + "\n"
    return commands


def run(shell, command, typed, lines):
    """What the command prints; of one in the background, as many lines as are shown of it."""
    here = f" <<'TYPED'\n{typed}TYPED" if typed else ""
    shell.stdin.write(f"{command}{here}\nstatus=$?; printf '\\1'; (exit $status)\n".encode())
    shell.stdin.flush()
    output = b""
    while b"\1" not in output or (command.endswith("&") and output.count(b"\n") < lines):
        output += shell.stdout.read1() or sys.exit(f"{command}: the shell has ended\n{output}")
    return output.replace(b"\1", b"").decode()


def without_variable(text):
    for pattern, name in VARIABLE:
        text = re.sub(pattern, name, text)
    return text


def main(page, programs):
    source = os.getcwd()
    commands = find_commands(read_page(page)) or sys.exit()
    environment = dict(os.environ, PATH=programs + ":/usr/sbin:/usr/bin:/sbin:/bin", SHELL="bash")
    with tempfile.TemporaryDirectory() as folder:
        os.symlink(source + "/doc", folder + "/doc")
        with subprocess.Popen(["vell-simulator", "--", "bash"], cwd=folder, env=environment,
                              stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                              stderr=subprocess.STDOUT) as shell:
            for command, typed, expected in commands:
                output = run(shell, command, typed, expected.count("\n"))
                if without_variable(output) != without_variable(expected):
                    sys.exit(f"{page}: $ {command}\nprints:\n{output}and not:\n{expected}")


main(*sys.argv[1:])
