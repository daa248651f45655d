# SPDX-License-Identifier: Apache-2.0
"""Providers over HTTPS: against the embedded provider, under load, and when one hangs."""
import contextlib
import os
import sqlite3
import subprocess

from harness.box import SUBTREE, ArrayServer, Host, rounds_of
from harness.crowds import report_rate


def https(suite):
    """All storage containers when the array is behind HTTPS, against the same array as a file."""
    with contextlib.ExitStack() as stack:
        hosts = {}
        # With fewer, both are nothing but the two questions whether anything has changed.
        for size in (size for size in suite.options.sizes if size >= 10000):
            hosts[size] = [stack.enter_context(Host(suite.build, suite.options.memory_on, suite.topology(size), https=far))
                           for far in (True, False)]
            for host in hosts[size]:
                host.register()
                _first(suite, host)
        for name, usual, before in (("changed", 8, _change), ("unchanged", 16, lambda _: None)):
            def turn(host):
                before(host.array)
                return _first(suite, host)

            def measure(size, rounds):
                return [tuple(turn(host) for host in hosts[size]) for _ in range(rounds)]

            times = suite.in_turns(lambda _: usual, measure, hosts)
            for size, pairs in times.items():
                suite.report.pairs(f"https {size} containers, {name}", pairs, 4.0, 4.0)
                suite.report.point("containers", f"HTTPS, {name}", size, [ours for ours, _ in pairs])
            ours, floors = ({size: [pair[place] for pair in pairs] for size, pairs in times.items()} for place in (0, 1))
            suite.report.growth(f"https, {name}: growth", ours.items(), 10.5, floors)


def _first(suite, host):
    return rounds_of([suite.build.program("bench_query"), "first"], host.env)[0][0]


def _change(array):
    """A commit to the array's file, so that nobody who knows its lists can take them for current."""
    with sqlite3.connect(array) as database:
        database.execute("UPDATE container SET max_lumo_size_mb = max_lumo_size_mb + 1 WHERE seq = 1")
    database.close()


def server(suite):
    """Requests a second of orkasim over connections that stay, against a TLS server that does nothing, with as many bytes."""
    with ArrayServer(suite.build, os.path.join(suite.scratch, "served"), suite.topology(3)) as array:
        for connections in (1, 10, 100):
            name, requests = f"server {connections} connections", 3000
            if suite.wanted(name):
                command = [suite.build.program("bench_rate"), "https", array.authority, "/orka/v1/queryStorageContainer",
                           array.certificate, array.key, str(connections), str(suite.options.rounds or 11), str(requests)]
                report_rate(suite, name, rounds_of(command, os.environ), requests, None, None)


def hung(suite):
    """A command of a host with a second provider that hangs and has been left out, against a host without it."""
    topology = suite.topology(3)
    with ArrayServer(suite.build, os.path.join(suite.scratch, "silent"), topology, "--misbehave", "hang") as silent, \
            Host(suite.build, suite.options.memory_on) as troubled, Host(suite.build, suite.options.memory_on) as well:
        for host in (troubled, well):
            host.register()
            host.lumo("storagecontainer", "load")
        troubled.trust(silent.url, silent.certificate)
        troubled.register(silent.url, "silent")
        # One command waits for half of its time; from then on the daemon knows.
        subprocess.run(["tovicli", "--timeout", "2", *SUBTREE, "storagecontainer", "load"], env=troubled.env, check=True,
                       stdout=subprocess.DEVNULL)
        commands = [["tovicli", "--root", host.root, *SUBTREE, "storagecontainer", "load"] for host in (troubled, well)]
        pair = [suite.build.program("bench_pair"), str(suite.options.rounds or 300), *commands[0], "--", *commands[1]]
        pairs = rounds_of(pair, troubled.env)
    suite.report.pairs("hung provider, left out", pairs, 1.1, 1.2)
