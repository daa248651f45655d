# SPDX-License-Identifier: Apache-2.0
"""Time against size, ours and the floor, as a picture."""
import subprocess

PANELS = (("containers", "storage containers"), ("volumes", "config volumes"), ("metadata", "metadata pairs"))


def script(series, path):
    """What gnuplot is told."""
    lines = [f"set terminal svg size 1260,520 dynamic background 'white' font 'sans-serif,13'; set output '{path}'",
             "set logscale xy; set grid; set key below; set colorsequence podo; set bmargin 9; set ylabel 'milliseconds'",
             "set xrange [600:160000]; set xtics ('1,000' 1000, '10,000' 10000, '100,000' 100000)",
             "set multiplot layout 1,3 title 'Time against size (both axes logarithmic): what a command takes, and its floor'"]
    for panel, title in PANELS:
        curves = series.get(panel, {})
        if not curves:
            lines.append("set multiplot next")
            continue
        for number, points in enumerate(curves.values()):
            lines += [f"$points{number} << end", *(f"{size} {ms}" for size, ms in sorted(points)), "end"]
        # What is no work of ours is dashed.
        plots = (f"$points{number} using 1:2 with linespoints lw 2 dt {2 if 'raw' in name else 1} pt 7 ps 0.6 title '{name}'"
                 for number, name in enumerate(curves))
        lines += [f"set title '{title}'", "plot " + ", ".join(plots)]
    return "\n".join([*lines, "unset multiplot", ""])


def draw(series, path):
    subprocess.run(["gnuplot"], input=script(series, path), text=True, check=True)
