# SPDX-License-Identifier: Apache-2.0
"""Long answers: through the client library, through commands, through formats."""
import contextlib
import os

from harness.box import SUBTREE, Host, rounds_of


def query(suite):
    """All storage containers through the client library against the same replies as raw bytes."""
    program = suite.build.program("bench_query")
    with contextlib.ExitStack() as stack:
        hosts = {size: stack.enter_context(Host(suite.build, suite.options.memory_on, suite.topology(size)))
                 for size in suite.options.sizes}
        for host in hosts.values():
            host.register()
        pairs = suite.in_turns(lambda size: max(12, 100000 // size),
                               lambda size, rounds: rounds_of([program, "time", str(rounds)], hosts[size].env))
        memory = {size: rounds_of([program, "memory"], host.env)[0] for size, host in hosts.items()}
    for size, taken in pairs.items():
        suite.report.pairs(f"query {size} containers", taken, 1.5, 2.0)
        _points(suite, "containers", size, taken, "query", "query: raw bytes")
    for size, (records, taken, peak) in memory.items():
        suite.report.line(f"query {size} containers: memory", taken / records, taken / records, taken / records, 1.3, 1.5,
                          f"{taken:,} bytes for {records:,} of records, grew by {peak:,} at the peak")
    _growth(suite, "query growth", pairs)


def _points(suite, plot, size, pairs, ours, floor):
    for line, column in zip((ours, floor), zip(*pairs)):
        suite.report.point(plot, line, size, column)


def _growth(suite, name, pairs):
    ours, floors = ({size: [row[place] for row in taken] for size, taken in pairs.items()} for place in (0, 1))
    suite.report.growth(name, ours.items(), 10.5, floors)


def read(suite):
    """Commands that ask for much, start to exit with all they print, against the same requests and replies as raw bytes."""
    for name, limit, plot, words, record in (
        ("read checklumos", 2.0, "volumes", ["storagecontainer", "checklumos", "-p", "{path}"], ["checklumos", "{container}"]),
        ("read metadata list", 4.0, "metadata", ["virtualvolume", "metadata", "list", "-c", "{container}", "-u", "{volume}"],
         ["metadata", "{container}", "{volume}"]),
    ):
        if not suite.wanted(name):
            continue
        with contextlib.ExitStack() as stack:
            commands = {}
            for size in suite.options.sizes:
                shape = {"volumes": size} if plot == "volumes" else {"volumes": 1, "metadata": size}
                host = stack.enter_context(Host(suite.build, suite.options.memory_on, suite.topology(1, **shape)))
                commands[size] = _commands(suite, host, words, record)

            def measure(size, rounds):
                ours, floor, env = commands[size]
                return rounds_of([suite.build.program("bench_pair"), str(rounds), *ours, "--", *floor], env)

            pairs = suite.in_turns(lambda size: max(8, 20000 // size), measure)
        for size, taken in pairs.items():
            suite.report.pairs(f"{name}, {size}", taken, 2.0, limit)
            _points(suite, plot, size, taken, name.removeprefix("read "), "raw bytes")
        _growth(suite, f"{name}: growth", pairs)


def _commands(suite, host, words, record):
    """@return the command, its floor, and their environment"""
    host.register()
    loaded = host.lumo_json("storagecontainer", "load")[0]
    facts = {"container": loaded["StorageContainer Id"], "path": os.path.join(host.root, "volumes", loaded["StorageContainer Name"])}
    facts["volume"] = host.lumo_json("storagecontainer", "checklumos", "-p", facts["path"])[0]["LumoId"]
    requests = os.path.join(host.root, "requests")
    host.record(requests, *(word.format(**facts) for word in record))
    return ["tovicli", *SUBTREE, *(word.format(**facts) for word in words)], [suite.build.program("bench_replay"), requests], host.env


def format(suite):
    """A result through a format against a writer of the same bytes that was written by hand, in one process."""
    for name in ("json", "table"):
        if suite.wanted(f"format {name}"):
            pairs = rounds_of([suite.build.program("bench_format"), name, str(suite.options.rounds or 41)], os.environ)
            suite.report.pairs(f"format {name}, 100000 rows", pairs, 2.0, 2.0)
