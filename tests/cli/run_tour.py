#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Runs the console blocks of a document in one shell and compares what comes back with what the document shows.

    run_tour.py DOCUMENT

In a block fenced with ```console, a line "$ command" is run (a backslash at its end continues it) and the lines up to the
next one are what it must print, standard output and standard error as they come. "…" stands for any text within a line,
a line "…" alone for any number of lines. A command that fails must be followed by "; echo status $?" or the like: the
shell itself has to go on with status 0.
"""
import re
import subprocess
import sys

END = "==== end of command"


def commands_of(text):
    """(line number, command, expected output) of each command in the console blocks."""
    found, inside, continued = [], False, False
    for number, line in enumerate(text.splitlines(), 1):
        if line.startswith("```"):
            inside = not inside and line == "```console"
            continued = False
        elif not inside:
            continue
        elif continued:
            found[-1][1] += "\n" + line
            continued = line.endswith("\\")
        elif line.startswith("$ "):
            found.append([number, line[2:], []])
            continued = line.endswith("\\")
        else:
            found[-1][2].append(line)
    return found


def matches(expected, seen):
    pattern = ""
    for line in expected:
        if line == "…":
            pattern += r"(?:[^\n]*\n)*?"
        else:
            pattern += r"[^\n]*".join(map(re.escape, line.split("…"))) + r"\n"
    return re.fullmatch(pattern, seen) is not None


def main():
    with open(sys.argv[1], encoding="utf-8") as file:
        commands = commands_of(file.read())
    if not commands:
        sys.exit(f"{sys.argv[1]} holds no commands")
    shell = subprocess.Popen(["bash"], stdin=subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
                             encoding="utf-8", errors="surrogateescape")
    failures = 0
    for number, command, expected in commands:
        # In braces, so that no command reads the next one from the shell's own input.
        shell.stdin.write(f"{{\n{command}\n}} </dev/null\nprintf '\\n{END} %s\\n' $?\n")
        shell.stdin.flush()
        seen = ""
        status = None
        for line in shell.stdout:
            if line.startswith(END):
                status = int(line.split()[-1])
                break
            seen += line
        # The empty line before the end mark keeps output apart that does not end with a newline.
        seen = seen[:-1]
        seen += "\n" if seen and not seen.endswith("\n") else ""
        if status is None:
            sys.exit(f"line {number}: the shell ended at: {command}\n{seen}")
        if status != 0 or not matches(expected, seen):
            failures += 1
            print(f"line {number}: {command}\n--- shown (status 0 expected):\n" + "\n".join(expected) +
                  f"\n--- seen (status {status}):\n{seen}")
    shell.stdin.close()
    shell.wait()
    print(f"{len(commands)} commands, {failures} of them not as shown")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
