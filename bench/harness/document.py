# SPDX-License-Identifier: Apache-2.0
"""The figures that are kept: docs/benchmarks.json holds them, docs/benchmarks.md and its plot show them."""
import json
import pathlib

from harness.figures import spread_of, verdict, written

# Above this the machine had other work, and readers are told.
QUIET_LOAD = 0.5


class Refused(Exception):
    """Figures that would spoil the document."""


def stamped(report, moment, machine):
    """A run's figures as they are kept: each row knows where and when it was measured."""
    return {"machine": machine, "rows": [{**row, **moment} for row in report.rows], "series": report.series}


def merged(kept, fresh):
    """What is kept after a run of some benchmarks: rows and lines of the same names are replaced where they stand, others
    are added at the end. Figures of two machines do not stand in one table."""
    if kept["machine"] != fresh["machine"]:
        raise Refused("these figures were measured on another machine than the document's; run all benchmarks to replace it")
    rows = {row["name"]: row for row in kept["rows"]}
    rows.update((row["name"], row) for row in fresh["rows"])
    series = {plot: dict(lines) for plot, lines in kept["series"].items()}
    for plot, lines in fresh["series"].items():
        series.setdefault(plot, {}).update(lines)
    return {"machine": kept["machine"], "rows": list(rows.values()), "series": series}


def replaced(text, part, lines):
    """The text with new lines between the two comments that mark a part."""
    begin, end = f"<!-- begin {part} -->\n", f"<!-- end {part} -->"
    if text.count(begin) != 1 or text.count(end) != 1 or text.index(begin) > text.index(end):
        raise Refused(f"the document lacks its marks of the part '{part}'")
    head, rest = text.split(begin)
    return head + begin + "\n".join(["", *lines, "", ""]) + end + rest.split(end)[1]


def bound(value, unit):
    return "" if value is None else written(value, unit) if unit else f"{value:g}"


def figures(data):
    """The table of all figures, as lines of Markdown."""
    if data is None:
        return ["Nothing was measured yet."]
    machine, rows = data["machine"], data["rows"]
    last = max(rows, key=lambda row: row["date"])
    lines = [f"Measured on: {machine['processor']}, {machine['cores']} cores, {machine['memory']} of memory, Linux {machine['kernel']}.",
             f"Revision {last['revision']}, {last['date']}; load of the machine before it began: {last['load']:g}."]
    if any(row["load"] > QUIET_LOAD for row in rows):
        lines.append("**The machine had other work while figures below were taken; they are noisier than they have to be.**")
    lines += ["", "| benchmark | median | middle half | goal | limit | verdict | |", "|---|---|---|---|---|---|---|"]
    for row in rows:
        unit = row["unit"]
        lines.append(f"| `{row['name']}` | {written(row['value'], unit)} | {spread_of(row)} | {bound(row['goal'], unit)} | "
                     f"{bound(row['limit'], unit)} | {verdict(row)} | {row['detail']} |")
    apart = [row for row in rows if row["revision"] != last["revision"] or row["date"][:10] != last["date"][:10]]
    if apart:
        lines += ["", "Measured at another time: "
                  + "; ".join(f"`{row['name']}` at revision {row['revision']}, {row['date']}" for row in apart) + "."]
    return lines


class Document:
    def __init__(self, folder):
        folder = pathlib.Path(folder)
        self.page, self.data, self.plot = folder / "benchmarks.md", folder / "benchmarks.json", folder / "benchmarks.svg"

    def kept(self):
        return json.loads(self.data.read_text(encoding="utf-8")) if self.data.exists() else None

    def write(self, fresh, is_whole):
        """Keeps a run's figures. @return what is kept now; @raise Refused nothing was written"""
        kept = None if is_whole else self.kept()
        if kept is None and not is_whole:
            raise Refused("there are no figures yet that some could be added to; run all benchmarks")
        data = merged(kept, fresh) if kept else fresh
        self.write_part("figures", figures(data))
        self.data.write_text(json.dumps(data, indent=1) + "\n", encoding="utf-8")
        return data

    def write_part(self, part, lines):
        page = replaced(self.page.read_text(encoding="utf-8"), part, lines)
        self.page.write_text(page, encoding="utf-8")
