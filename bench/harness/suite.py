# SPDX-License-Identifier: Apache-2.0
"""All benchmarks in their order, and what they share."""
import math
import pathlib
import subprocess
import tempfile

from harness import commands, crowds, network, reads
from harness.box import TOP
from harness.figures import Report

# The first word of a benchmark's name, and what runs it.
BENCHMARKS = (
    ("start", commands.start),
    ("memory", commands.memory),
    ("query", reads.query),
    ("load", commands.load),
    ("read", reads.read),
    ("write", commands.write),
    ("format", reads.format),
    ("clients", crowds.clients),
    ("priority", crowds.priority),
    ("idle", crowds.idle),
    ("https", network.https),
    ("server", network.server),
    ("hung", network.hung),
)


TURNS = 4


class Suite:
    def __init__(self, build, options):
        self.build, self.options, self.report, self.scratch = build, options, Report(), None

    def wanted(self, name):
        return not self.options.names or any(name.startswith(n) or n.startswith(name) for n in self.options.names)

    def topology(self, containers, volumes=0, metadata=0):
        """Arrays with 2 storage arrays of 4 endpoints each that both hold every container."""
        path = pathlib.Path(self.scratch) / f"topology-{containers}-{volumes}-{metadata}.json"
        if not path.exists():
            with open(path, "w", encoding="utf-8") as file:
                subprocess.run([TOP / "lab/generate-topology", "--arrays", "2", "--endpoints", "4", "--containers",
                                str(containers), "--volumes", str(volumes), "--metadata", str(metadata)],
                               check=True, stdout=file)
        return str(path)

    def in_turns(self, usual, measure, sizes=None):
        """Measures every size a few rounds at a time, in turns: growth compares sizes, and a machine's pace drifts.

        @param usual rounds by size; measure a function of size and number of rounds that returns them as a list; sizes which,
        if not all
        @return rounds by size
        """
        rounds = {size: self.options.rounds or usual(size) for size in (self.options.sizes if sizes is None else sizes)}
        taken = {size: [] for size in rounds}
        while left := [size for size in rounds if len(taken[size]) < rounds[size]]:
            for size in left:
                taken[size] += measure(size, min(math.ceil(rounds[size] / TURNS), rounds[size] - len(taken[size])))
        return taken

    def run(self):
        with tempfile.TemporaryDirectory(prefix="tovi-bench-scratch.") as self.scratch:
            for name, benchmark in BENCHMARKS:
                if self.wanted(name):
                    benchmark(self)
        return self.report
