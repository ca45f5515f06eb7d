#!/usr/bin/env python3
"""The one form in which benchmarks report a figure, for scripts; Measurements.h prints the same.

    Benchmarks/figures.py WHAT OURS STANDIN UNIT [GOAL]

prints ours, what stands beside it, their ratio, and what the ratio may be at most. WHAT names both.
"""
import re
import sys
from dataclasses import dataclass

# At least two spaces part the columns.
NUMBER = r"-?(?:[\d.]+|nan|inf)"
LINE = re.compile(rf"(?P<what>\S.*? / .*?)  +(?P<ours>{NUMBER})(?: (?P<unit>[^\s\d]+))?  +(?P<stand_in>{NUMBER})"
                  rf"(?: [^\s\d]+)?  +(?P<ratio>{NUMBER})  +(?P<goal>\d+\.\d\d|-)(?:  +\w+)?\s*")


@dataclass(frozen=True)
class Figure:
    what: str
    ours: float
    stand_in: float
    ratio: float
    unit: str = ""
    goal: float | None = None

    @property
    def verdict(self):
        """What is missed by less than a tenth may be the machine's doing."""
        if self.goal is None:
            return ""
        return "met" if self.ratio <= self.goal else "nearly" if self.ratio <= 1.1 * self.goal else "MISSED"

    def columns(self):
        goal = "-" if self.goal is None else f"{self.goal:.2f}"
        return [number(self.ours), number(self.stand_in), f"{self.ratio:.2f}", goal]

    def __str__(self):
        ours, stand_in, ratio, goal = self.columns()
        return (f"{self.what:<64}  {ours:>8} {self.unit:<2}  {stand_in:>8} {self.unit:<2}  {ratio:>6}  {goal:>6}  "
                f"{self.verdict}").rstrip()


def number(value):
    """Three digits or more: "0.27", "35.1", "1204"."""
    return f"{value:.{2 if value < 10 else 1 if value < 1000 else 0}f}"


def report(what, ours, stand_in, unit, goal=None):
    print(Figure(what, ours, stand_in, ours / stand_in, unit, goal), flush=True)


def parse(line):
    """The figure that a line reports; none if it is of another form."""
    match = LINE.fullmatch(line)
    if not match:
        return None
    goal = None if match["goal"] == "-" else float(match["goal"])
    return Figure(match["what"], float(match["ours"]), float(match["stand_in"]), float(match["ratio"]),
                  match["unit"] or "", goal)


if __name__ == "__main__":
    name, own, other, suffix, *limit = sys.argv[1:]
    report(name, float(own), float(other), suffix, *map(float, limit))
