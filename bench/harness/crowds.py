# SPDX-License-Identifier: Apache-2.0
"""The daemon and its many clients."""
import os
import subprocess

from harness.box import ArrayServer, Host, rounds_of
from harness.figures import median, written


def report_rate(suite, name, rounds, requests, goal, limit):
    """Rounds as bench_rate prints them."""
    def column(place):
        return median([row[place] for row in rounds])
    rates = [requests / (column(place) / 1e9) for place in (0, 1)]
    detail = (f"{rates[0]:,.0f} requests/s against {rates[1]:,.0f}; half within {written(column(2) / 1e6, 'ms')}, "
              f"99 of 100 within {written(column(3) / 1e6, 'ms')}, against {written(column(4) / 1e6)} and {written(column(5) / 1e6)}")
    suite.report.pairs(name, [(ours, floor) for ours, floor, *_ in rounds], goal, limit, detail)


def clients(suite):
    """Requests a second of so many clients against a server that does nothing, with as many bytes."""
    with Host(suite.build, suite.options.memory_on) as host:
        host.register()
        for what, crowd, requests in (("ping", 1, 10000), ("ping", 10, 20000), ("ping", 100, 20000), ("ping", 1000, 20000),
                                      ("containers", 10, 10000)):
            name = f"clients {crowd}, {what}"
            if suite.wanted(name):
                command = [suite.build.program("bench_rate"), "daemon", what, str(crowd), str(suite.options.rounds or 11), str(requests)]
                report_rate(suite, name, rounds_of(command, host.env), requests, 3.0 if what == "ping" else None,
                            4.0 if what == "ping" else None)


def idle(suite):
    """What a client costs the daemon that asked once and stays."""
    counts = ["100", "1000"]
    runs = []
    for _ in range(suite.options.rounds or 3):
        with Host(suite.build, suite.options.memory_on) as host:
            host.register()
            runs.append(rounds_of([suite.build.program("bench_idle"), *counts], host.env))
    for place, count in enumerate(counts):
        each = [run[place][1] / int(count) / 1024 for run in runs]
        suite.report.amounts(f"idle {count} clients, each", each, "KiB", None, None, "resident memory of the daemon")


def priority(suite):
    """Requests over the priority socket while the ordered queue is stuck behind a provider that hangs."""
    topology = suite.topology(1, volumes=1)
    hang = ("--misbehave", "hang", "--on", "createVirtualVolume")
    with ArrayServer(suite.build, os.path.join(suite.scratch, "hung"), topology, *hang) as server, \
            Host(suite.build, suite.options.memory_on) as host:
        host.trust(server.url, server.certificate)
        host.register(server.url)
        loaded = host.lumo_json("storagecontainer", "load")[0]
        path = os.path.join(host.root, "volumes", loaded["StorageContainer Name"])
        volume = host.lumo_json("storagecontainer", "checklumos", "-p", path)[0]["LumoId"]
        rounds = str(suite.options.rounds or 7)
        text = subprocess.run([suite.build.program("bench_priority"), loaded["StorageContainer Id"], volume, rounds, "1000"],
                              env=host.env, check=True, text=True, stdout=subprocess.PIPE).stdout
    taken = {}
    for line in text.splitlines():
        queue, name, *figures = line.split()
        taken.setdefault((queue, name), []).append([int(nanoseconds) / 1e6 for nanoseconds in figures])
    for name in ("ping", "containers", "bind"):
        half, most, longest = zip(*taken["stuck", name])
        free_half, free_most, _ = zip(*taken["free", name])
        suite.report.amounts(f"priority {name}, ordered queue stuck", most, "ms", 10, 10,
                             f"99 of 100 requests; half within {written(median(half))}, the longest {written(max(longest))}; before the "
                             f"queue was stuck 99 of 100 within {written(median(free_most))}, half within {written(median(free_half))}")
