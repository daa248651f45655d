# SPDX-License-Identifier: Apache-2.0
"""The arithmetic of benchmarks: medians, spreads, ratios, growth, verdicts. Knows nothing of how figures come about."""
import statistics

median = statistics.median


def quartiles(values):
    """What the middle half lies between; of fewer than four values, all of them."""
    if len(values) < 4:
        return min(values), max(values)
    low, _, high = statistics.quantiles(values, n=4)
    return low, high


def verdict(row):
    if row["goal"] is None:
        return "no goal"
    if row["value"] <= row["goal"]:
        return "within the goal"
    return "past the goal" if row["value"] <= row["limit"] else "PAST THE LIMIT"


def written(value, unit=""):
    """A figure as people read it."""
    digits = 0 if abs(value) >= 1000 else 1 if abs(value) >= 100 else 2
    return f"{value:,.{digits}f}" + (f" {unit}" if unit else "")


def spread_of(row):
    return f"{written(row['low'])} to {written(row['high'])}"


class Report:
    """Rows in the order in which they were measured, each printed as it comes, and the lines of the plot."""

    def __init__(self, out=print):
        self.rows, self.series, self.out = [], {}, out

    @property
    def is_over(self):
        return any(verdict(row) == "PAST THE LIMIT" for row in self.rows)

    def line(self, name, value, low, high, goal, limit, detail, unit=""):
        """A figure: a ratio, or in a unit. Goal and limit are its own, or None."""
        row = {"name": name, "value": value, "low": low, "high": high, "goal": goal, "limit": limit, "unit": unit, "detail": detail}
        self.rows.append(row)
        bounds = "" if goal is None else f"goal {goal:<5} limit {limit:<5}"
        self.out(f"{name:<44} {written(value, unit):>10}  ({spread_of(row)})  {bounds} {verdict(row):<16} {detail}")

    def pairs(self, name, pairs, goal, limit, detail=""):
        """Rounds of (ours, floor) in nanoseconds: the ratio of their medians, and the rounds' ratios as its spread."""
        low, high = quartiles([ours / floor for ours, floor in pairs])
        ours, floor = (median(column) / 1e6 for column in zip(*pairs))
        best = min(pair[0] for pair in pairs) / min(pair[1] for pair in pairs)
        told = f"{ours:.3f} ms against {floor:.3f} ms, at best {best:.2f}"
        self.line(name, ours / floor, low, high, goal, limit, f"{told}; {detail}" if detail else told)

    def amounts(self, name, values, unit, goal, limit, detail):
        """Amounts of the same thing in one unit: their median and spread."""
        low, high = quartiles(values)
        self.line(name, median(values), low, high, goal, limit, detail, unit)

    def growth(self, name, times, limit, floors=None):
        """Times by size, in the sizes' order: how much longer each size took than the one before it. Where the floor grew more
        than the limit, as it does when a cache no longer holds everything, a tenth more than the floor is the limit."""
        times = list(times)
        for (small, small_times), (large, large_times) in zip(times, times[1:]):
            floor = median(floors[large]) / median(floors[small]) if floors else 0
            told = f"; the floor grew {floor:.2f} times" if floors else ""
            base = median(small_times)
            low, high = quartiles(large_times)
            self.line(f"{name}: {small} to {large}", median(large_times) / base, low / base, high / base, limit, max(limit, round(1.1 * floor, 1)),
                      f"{large / small:g} times as many{told}")

    def point(self, plot, line, size, nanoseconds):
        """A point of the plot."""
        self.series.setdefault(plot, {}).setdefault(line, []).append([size, median(nanoseconds) / 1e6])
