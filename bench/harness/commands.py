# SPDX-License-Identifier: Apache-2.0
"""What a command costs: from start to exit, in memory, and in durable writes."""
import contextlib
import os
import pathlib
import shutil
import time

from harness.box import SUBTREE, Host, durable_copy, rounds_of, timed

# Seconds after which a slow disk is asked for no more rounds than three.
PATIENCE = 60
# Containers that a host has mounted whose volumes are mounted: a command looks at each of them.
MOUNTED = 10


def start(suite):
    """A command from start to exit against a program that does nothing."""
    rounds = suite.options.rounds or 400
    with Host(suite.build, suite.options.root_on) as host:
        host.register()
        host.lumo("storagecontainer", "load")
        for name, goal, limit, words in (
            ("start --version", 1.2, 1.5, ["tovicli", "--version"]),
            ("start daemon set", 1.6, 2.0, ["tovicli", *SUBTREE, "daemon", "set", "--log-level", "info"]),
            ("start load, nothing to do", 1.6, 2.5, ["tovicli", *SUBTREE, "storagecontainer", "load"]),
        ):
            if suite.wanted(name):
                command = [suite.build.program("bench_pair"), str(rounds), *words, "--", suite.build.program("bench_nothing")]
                suite.report.pairs(name, rounds_of(command, host.env), goal, limit)


def memory(suite):
    """The most memory that a command which reads has resident, and what a program that does nothing has."""
    with Host(suite.build, suite.options.memory_on, suite.topology(3, volumes=1, metadata=10)) as host:
        host.register()
        loaded = host.lumo_json("storagecontainer", "load")[0]
        container = loaded["StorageContainer Id"]
        path = os.path.join(host.root, "volumes", loaded["StorageContainer Name"])
        volume = host.lumo_json("storagecontainer", "checklumos", "-p", path)[0]["LumoId"]
        for name, words in (
            ("memory load, nothing to do", ["storagecontainer", "load"]),
            ("memory checklumos", ["storagecontainer", "checklumos", "-p", path]),
            ("memory virtualvolume get", ["virtualvolume", "get", "-c", container, "-u", volume]),
            ("memory metadata list", ["virtualvolume", "metadata", "list", "-c", container, "-u", volume]),
        ):
            if suite.wanted(name):
                command = [suite.build.program("bench_pair"), "--memory", "tovicli", *SUBTREE, *words, "--",
                           suite.build.program("bench_nothing")]
                peaks = [rounds_of(command, host.env)[0] for _ in range(suite.options.rounds or 5)]
                suite.report.amounts(name, [ours / 1024 for ours, _ in peaks], "MiB", 10, 10,
                                     f"a program that does nothing has {max(floor for _, floor in peaks) / 1024:.2f}")


def load(suite):
    """Load with every container mounted already, against a bare program that reads the same answer as bytes and the same names
    and ids from a copy of the same file; and what both grow like."""
    with contextlib.ExitStack() as stack:
        commands = {}
        for size in suite.options.sizes:
            host = stack.enter_context(Host(suite.build, suite.options.memory_on, suite.topology(size)))
            host.register()
            host.lumo("storagecontainer", "load")
            recording, copy = (os.path.join(host.root, name) for name in ("requests", "copy.db"))
            host.record(recording, "containers")
            shutil.copy(os.path.join(host.root, "host.db"), copy)
            commands[size] = [suite.build.program("bench_mounted"), recording, copy], host.env

        def measure(size, rounds):
            floor, env = commands[size]
            return rounds_of([suite.build.program("bench_pair"), str(rounds), "tovicli", *SUBTREE, "storagecontainer", "load", "--",
                              *floor], env)

        pairs = suite.in_turns(lambda size: max(8, 20000 // size), measure)
    ours, floors = ({size: [row[place] for row in taken] for size, taken in pairs.items()} for place in (0, 1))
    for size, taken in pairs.items():
        suite.report.pairs(f"load, all mounted, {size}", taken, 2.0, 3.0)
        suite.report.point("containers", "load, all mounted", size, ours[size])
    suite.report.growth("load, all mounted: growth", ours.items(), 10.5, floors)


def write(suite):
    """Writing commands against a bare program that commits as many durable transactions to a copy of the same file on the same
    disk, and asks the daemon once where the command needs it. Each round begins with the files of the first."""
    with Host(suite.build, suite.options.root_on, suite.topology(1000)) as host:
        host.register()
        _write_and_restore(suite, host)
    if suite.wanted("write configlumo mount") or suite.wanted("write configlumo umount"):
        with Host(suite.build, suite.options.root_on, suite.topology(MOUNTED)) as host:
            host.register()
            _write_config_volume(suite, host, host.lumo_json("storagecontainer", "load")[0]["StorageContainer Id"])


def _write_and_restore(suite, host):
    template = pathlib.Path(suite.scratch) / "template.db"
    shutil.copy(os.path.join(host.root, "host.db"), template)
    directories = os.path.join(host.root, "bare-volumes")

    def restore(name):
        for made in (os.path.join(host.root, "volumes"), directories):
            shutil.rmtree(made, ignore_errors=True)
        return durable_copy(template, os.path.join(host.root, name))

    def pair(command, transactions, inserts):
        restore("host.db")
        ours = timed(["tovicli", *SUBTREE, *command], host.env)
        floor = [suite.build.program("bench_transactions"), restore("bare.db"), str(transactions), inserts]
        if command[0] == "storagecontainer":
            os.mkdir(directories)
            floor.append(directories)
        return ours, timed(floor, host.env)

    for name, rounds, limit, command, transactions, inserts in (
        ("write provider add", 60, 1.5, ["orkaprovider", "add", "--vp-name", "new", "--vp-url", "u"], 1,
         "INSERT INTO provider (name, url, aux_text) VALUES (?1, '', '')"),
        ("write load of 1000 new containers", 9, 1.4, ["storagecontainer", "load"], 1000,
         "INSERT INTO file_system (name, container_id) VALUES (?1, ?2);"
         "INSERT INTO file_system_array (file_system, position, array_id) SELECT id, column1, column2 FROM file_system, "
         "(VALUES (0, 'be4c0000-0000-4000-8000-00000000000a'), (1, 'be4c0000-0000-4000-8000-00000000000b')) WHERE name = ?1"),
    ):
        if suite.wanted(name):
            pairs, end = [], time.monotonic() + PATIENCE
            while len(pairs) < (suite.options.rounds or rounds) and (len(pairs) < 3 or time.monotonic() < end):
                pairs.append(pair(command, transactions, inserts))
            suite.report.pairs(name, pairs, 1.4, limit)
    restore("host.db")


def _write_config_volume(suite, host, container):
    """A mount and an unmount are a change of one row of the host store, one request, and the rename of a directory, once the
    volume is bound."""
    volume = ["--name", "bench", "--container-id", container]
    for command in ("add", "mount", "umount"):
        host.lumo("configlumo", command, *volume)
    bare, ping, here, there = (os.path.join(host.root, name) for name in ("bare.db", "ping", "here", "there"))
    host.record(ping, "ping")
    os.mkdir(here)
    change = "UPDATE volume SET state = 2, directory_name = ?1"
    floor = [suite.build.program("bench_transactions"), bare, "1", change, ping, os.path.join(host.root, "run", "lumod.sock")]
    # The floor undoes no mount, so every round begins with the same row: that of a volume which was unmounted just now.
    template = shutil.copy(os.path.join(host.root, "host.db"), os.path.join(host.root, "template.db"))
    pairs = {"mount": [], "umount": []}
    for _ in range(suite.options.rounds or 60):
        for command, taken in pairs.items():
            ours = timed(["tovicli", *SUBTREE, "configlumo", command, *volume], host.env)
            durable_copy(template, bare)
            taken.append((ours, timed([*floor, here, there], host.env)))
            here, there = there, here
    for command, taken in pairs.items():
        suite.report.pairs(f"write configlumo {command}", taken, 1.4, 1.5)
