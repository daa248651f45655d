#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Holds docs/faults.md to the tests: every case has its row, every test that a row names exists, and every test that
carries a case's number is one that the row speaks for."""

import pathlib
import re
import sys

TOP = pathlib.Path(__file__).resolve().parent.parent.parent
CASES = set(range(1, 65)) - {16, 32}  # two numbers were never given
ROW = re.compile(r"^\| (\d+) \| (.+?) \| (.+?) \| (.+) \|$")
DEFINITIONS = (
    re.compile(r"^\s*TEST(?:_F|_P)?\((\w+),\s*(\w+)\)", re.M),
    re.compile(r"^@test \"([^\"]+)\"", re.M),
    re.compile(r"^\s*def (test_\w+)\(", re.M),
    re.compile(r"^class (Fault\d+\w+)\(", re.M),
)


def tests():
    """The names of all tests: Suite.name, a transcript's title, a Python method or class."""
    names = set()
    for path in (TOP / "tests").rglob("*"):
        if path.suffix in (".cpp", ".bats", ".py") and path != pathlib.Path(__file__).resolve():
            text = path.read_text(encoding="utf-8")
            for definition in DEFINITIONS:
                names |= {".".join(match.groups()) for match in definition.finditer(text)}
    return names


def number_of(name):
    match = re.search(r"(?:fault_|^Fault)(\d+)", name)
    return int(match.group(1)) if match else None


def main():
    known = tests()
    complaints = []
    rows = {}
    for line in (TOP / "docs/faults.md").read_text(encoding="utf-8").splitlines():
        match = ROW.match(line)
        if match:
            number = int(match.group(1))
            if number in rows:
                complaints.append(f"case {number} has two rows")
            rows[number] = match.groups()
    complaints += [f"case {n} has no row" for n in sorted(CASES - rows.keys())]
    complaints += [f"there is no case {n}" for n in sorted(rows.keys() - CASES)]
    named = 0
    spoken_for = {}  # which tests each row names
    for number, (_, _, _, shown) in sorted(rows.items()):
        spoken_for[number] = set()
        # A test is named in backticks; a name that ends in * stands for all that begin so.
        for name in re.findall(r"`([^`]+)`", shown):
            named += 1
            found = [k for k in known if k == name or (name.endswith("*") and k.startswith(name[:-1]))]
            spoken_for[number].update(found)
            if not found:
                complaints.append(f"case {number}: there is no test '{name}'")
        if "`" not in shown and not shown.startswith(("cannot arise", "not yet")):
            complaints.append(f"case {number} names no test and does not say why")
        if shown.startswith("cannot arise") and any(number_of(name) == number for name in known):
            complaints.append(f"case {number} is said not to arise, and has a test")
    for name in sorted(known):
        number = number_of(name)
        if number is not None and number not in rows:
            complaints.append(f"the test '{name}' is of case {number}, which has no row")
        elif number is not None and name not in spoken_for[number]:
            complaints.append(f"the test '{name}' is of case {number}, whose row does not name it")
    for complaint in complaints:
        print(f"docs/faults.md: {complaint}", file=sys.stderr)
    print(f"{len(rows)} cases, {named} tests named, {len(complaints)} complaints")
    return 1 if complaints or named < 60 else 0


sys.exit(main())
