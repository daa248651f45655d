#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Compares what is said of each command in four places, and prints where they differ.

    check_drift.py MAN-DIRECTORY

The declaration (`cli describe`) against help (`--help`), the manual page (MAN-DIRECTORY/tovicli-....1) and completion
(`cli completion bash`): the options in declared order, their short forms, which of them are required, the fields of the
result at every depth, the examples; of the tool itself, the global options.
"""
import json
import pathlib
import re
import subprocess
import sys

differences = []


def tovicli(*words):
    run = subprocess.run(["tovicli", *words], capture_output=True, text=True, check=False)
    if run.returncode != 0 or run.stderr:
        sys.exit(f"tovicli {' '.join(words)} ended with {run.returncode}: {run.stderr}")
    return run.stdout


def compare(path, what, declared, told):
    if declared != told:
        differences.append(f"{path}: {what}: {declared} is declared, {told} is told")


def section(text, title):
    """The lines of a section of a help text: from its title to the next empty line."""
    match = re.search(rf"^{re.escape(title)}.*\n((?:.+\n)*)", text, re.M)
    return match.group(1) if match else ""


def roff_section(page, title):
    match = re.search(rf"^\.SH {title}\n((?:(?!\.SH).*\n)*)", page, re.M)
    return match.group(1) if match else ""


def plain(roff):
    for escape, character in ((r"\fB", ""), (r"\fI", ""), (r"\fR", ""), (r"\-", "-"), (r"\(aq", "'"), (r"\&", ""), (r"\e", "\\")):
        roff = roff.replace(escape, character)
    return roff


def help_options(lines):
    """[(short form, name, required)]"""
    return [(match[1] or "", match[2], "Required." in match[3])
            for match in re.finditer(r"^  (?:(-\w), |    )--(\S+)((?:.*\n(?!  -|      --))*.*\n)", lines, re.M)]


def page_options(lines):
    return [(match[1] or "", match[2], match[3].startswith("Required."))
            for match in re.finditer(r"^\.TP\n(?:(-\w), )?--(\S+).*\n(.*)\n", plain(lines), re.M)]


def declared_fields(schema, depth=0):
    """[(depth, name)], in declared order."""
    if schema.get("type") == "array":
        return declared_fields(schema.get("items", {}), depth)
    fields = []
    for name, value in schema.get("properties", {}).items():
        fields.append((depth, name))
        fields += declared_fields(value, depth + 1)
    return fields


def help_fields(lines):
    return [(len(match[1]) // 2 - 1, match[2]) for match in re.finditer(r"^((?:  )+)(\S.*?)  +\S", lines, re.M)]


def page_fields(lines):
    fields, depth = [], 0
    lines = plain(lines).splitlines()
    for place, line in enumerate(lines):
        depth += (line == ".RS") - (line == ".RE")
        if line == ".TP":
            fields.append((depth, lines[place + 1]))
    return fields


def main():
    manual = pathlib.Path(sys.argv[1])
    completion = tovicli("cli", "completion", "bash")
    completed = dict(re.findall(r"^_tovicli_options\['(.*?)'\]='(.*)'$", completion, re.M))
    shorts = re.findall(r"^_tovicli_values\['([^:']*):(-\w)'\]=", completion, re.M)
    commands = [command["Path"] for command in json.loads(tovicli("--format", "json", "cli", "command", "list"))]
    compare("the manual", "pages", sorted(f"tovicli-{path.replace(' ', '-')}.1" for path in commands),
            sorted(page.name for page in manual.glob("tovicli-*.1")))
    for path in commands:
        words = path.split(" ")
        declaration = json.loads(tovicli("cli", "describe", *words))
        options = [(f"-{parameter['alias']}" if parameter["alias"] else "", parameter["name"], parameter["required"])
                   for parameter in declaration["parameters"]]
        fields = declared_fields(declaration["result"] or {})
        told = tovicli(*words, "--help")
        page = (manual / f"tovicli-{'-'.join(words)}.1").read_text(encoding="utf-8")

        compare(path, "options in help", options, help_options(section(told, "Options:")))
        compare(path, "options in the manual", options, page_options(roff_section(page, "OPTIONS")))
        compare(path, "options in completion", [f"--{name}" for _, name, _ in options],
                completed.get("tovicli " + path, "").split())
        compare(path, "short forms in completion", sorted(short for short, _, _ in options if short),
                sorted(short for place, short in shorts if place == "tovicli " + path))
        compare(path, "fields in help", fields, help_fields(section(told, "Result:")))
        compare(path, "fields in the manual", fields, page_fields(roff_section(page, "RESULT")))
        compare(path, "number of examples", len(re.findall(r"^\.EX$", page, re.M)),
                len(re.findall(r"^      tovicli ", section(told, "Examples:"), re.M)))
    page = (manual / "tovicli.1").read_text(encoding="utf-8")
    options = help_options(section(tovicli("--help"), "Global options:"))
    compare("tovicli", "options in the manual", options, page_options(roff_section(page, "GLOBAL OPTIONS")))
    compare("tovicli", "options in completion", [f"--{name}" for _, name, _ in options], completed["tovicli"].split())
    compare("tovicli", "commands in the manual", commands, re.findall(r"^\.TP\n(.*)\n", plain(roff_section(page, "COMMANDS")), re.M))
    for difference in differences:
        print(difference)
    print(f"{len(commands)} commands, {len(differences)} differences")
    return 1 if differences or len(commands) < 22 else 0


sys.exit(main())
