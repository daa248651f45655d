# SPDX-License-Identifier: Apache-2.0
"""Long answers: through the client library, through commands, through formats."""
import os
import subprocess

from harness.box import SUBTREE, Host, rounds_of


def query(suite):
    """All storage containers through the client library against the same replies as raw bytes."""
    times = []
    for size in suite.options.sizes:
        rounds = suite.options.rounds or max(10, 100000 // size)
        with Host(suite.build, suite.options.memory_on, suite.topology(size)) as host:
            host.register()
            pairs = rounds_of([suite.build.program("bench_query"), "time", str(rounds)], host.env)
            suite.report.pairs(f"query {size} containers", pairs, 1.5, 2.0)
            ours, floor = zip(*pairs)
            suite.report.point("containers", "query", size, ours)
            suite.report.point("containers", "query: raw bytes", size, floor)
            times.append((size, ours))
            records, taken, peak = rounds_of([suite.build.program("bench_query"), "memory"], host.env)[0]
            suite.report.line(f"query {size} containers: memory", taken / records, taken / records, taken / records, 1.3, 1.5,
                              f"{taken:,} bytes for {records:,} of records, grew by {peak:,} at the peak")
    suite.report.growth("query growth", times, 10.5)


def read(suite):
    """Commands that ask for much, start to exit with all they print, against the same requests and replies as raw bytes."""
    for name, plot, words, record in (
        ("read checklumos", "volumes", ["storagecontainer", "checklumos", "-p", "{path}"], ["checklumos", "{container}"]),
        ("read metadata list", "metadata", ["virtualvolume", "metadata", "list", "-c", "{container}", "-u", "{volume}"],
         ["metadata", "{container}", "{volume}"]),
    ):
        if not suite.wanted(name):
            continue
        times = []
        for size in suite.options.sizes:
            shape = {"volumes": size} if plot == "volumes" else {"volumes": 1, "metadata": size}
            with Host(suite.build, suite.options.memory_on, suite.topology(1, **shape)) as host:
                pairs = _read_pairs(suite, host, size, words, record)
            suite.report.pairs(f"{name}, {size}", pairs, 2.0, 2.0)
            ours, floor = zip(*pairs)
            suite.report.point(plot, name.removeprefix("read "), size, ours)
            suite.report.point(plot, "raw bytes", size, floor)
            times.append((size, ours))
        suite.report.growth(f"{name}: growth", times, 10.5)


def _read_pairs(suite, host, size, words, record):
    host.register()
    loaded = host.lumo_json("storagecontainer", "load")[0]
    facts = {"container": loaded["StorageContainer Id"], "path": os.path.join(host.root, "volumes", loaded["StorageContainer Name"])}
    facts["volume"] = host.lumo_json("storagecontainer", "checklumos", "-p", facts["path"])[0]["LumoId"]
    requests = os.path.join(host.root, "requests")
    replay = suite.build.program("bench_replay")
    subprocess.run([replay, "record", requests, *(word.format(**facts) for word in record)], env=host.env, check=True)
    rounds = suite.options.rounds or max(7, 20000 // size)
    command = [suite.build.program("bench_pair"), str(rounds), "tovicli", *SUBTREE, *(word.format(**facts) for word in words), "--",
               replay, requests]
    return rounds_of(command, host.env)


def format(suite):
    """A result through a format against a writer of the same bytes that was written by hand, in one process."""
    for name in ("json", "table"):
        if suite.wanted(f"format {name}"):
            pairs = rounds_of([suite.build.program("bench_format"), name, str(suite.options.rounds or 41)], os.environ)
            suite.report.pairs(f"format {name}, 100000 rows", pairs, 2.0, 2.0)
