#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Three hosts at work on one array at once, with daemons and the array's server killed in the middle: nothing that was
acknowledged is lost, nothing is there that nobody made, and at the end every host sees what the array holds.

TOVI_LONG=1 makes the work longer and kills more often.
"""

import os
import threading
import time
import unittest

from fleet import CONTAINERS, Fleet
import suite

LONG = os.environ.get("TOVI_LONG") == "1"
WORKERS = 2  # a host
ROUNDS = 60 if LONG else 6
CONTESTED = 40 if LONG else 6
# A command that was cut off is repeated, and may find that it had been done.
ALREADY = {"add": "already", "mount": "is mounted already", "umount": "is mounted in", "remove": "has no config volume"}


class Worker(threading.Thread):
    """One user of one host: makes volumes, uses them, and leaves every third one behind."""

    one_mishap = threading.Lock()

    def __init__(self, host, number, mishaps):
        super().__init__(daemon=True)
        self.host, self.number, self.mishaps = host, number, mishaps
        self.kept = {name: set() for name in CONTAINERS}
        self.commands = self.repeated = 0
        self.failure = None

    def run(self):
        try:
            for turn in range(ROUNDS):
                if turn in self.mishaps:
                    with Worker.one_mishap:
                        self.mishaps[turn]()
                self.cycle(turn)
        except BaseException as failure:  # pylint: disable=broad-except
            self.failure = failure

    def insist(self, verb, *words):
        """Gets a command done, however often a daemon or the array's server dies meanwhile."""
        cut_off = False
        deadline = time.monotonic() + 60
        while True:
            disturbances = self.host.disturbances
            self.commands += 1
            ended = self.host.lumo("configlumo", verb, *words)
            if ended.status == 0 or (cut_off and ended.status == 1 and ALREADY[verb] in ended.err):
                return
            disturbed = self.host.disturbances != disturbances or not self.host.is_up.is_set()
            assert disturbed and time.monotonic() < deadline, ended
            self.repeated += 1
            cut_off = True
            assert self.host.is_up.wait(timeout=30), "what died did not come back"

    def cycle(self, turn):
        container = list(CONTAINERS)[turn % len(CONTAINERS)]
        name = f"{self.host.name}-{self.number}-{turn}"
        words = ("-n", name, "-c", CONTAINERS[container])
        directory = self.host.root / "volumes" / container / name
        self.insist("add", *words, "-s", str(1 + turn))
        self.insist("mount", *words)
        (directory / "content").write_text(name)
        self.insist("umount", *words)
        assert not directory.exists(), f"{name} is not unmounted"
        self.insist("mount", *words)
        assert (directory / "content").read_text() == name, f"{name} has lost its content"
        if turn % 3 == 2:
            self.kept[container].add(name)
        else:
            self.insist("remove", *words)
            assert not directory.exists(), f"{name} is not removed"


class Load(unittest.TestCase):
    def setUp(self):
        self.fleet = self.enterContext(Fleet())
        self.fleet.join(self.url())
        self.before = self.fleet.everything()

    def url(self):
        """Where hosts find the array."""
        return None

    def test_hosts_share_an_array_and_what_they_need_dies(self):
        at_first = {name: self.fleet.names(name) for name in CONTAINERS}
        workers = [Worker(host, number, self.mishaps(host) if number == 0 else {})
                   for host in self.fleet.hosts for number in range(WORKERS)]
        for worker in workers:
            worker.start()
        for worker in workers:
            worker.join()
        for worker in workers:
            if worker.failure is not None:
                raise worker.failure
        self.assertEqual([host.kills > 0 for host in self.fleet.hosts], [False, True, True])
        commands = sum(worker.commands for worker in workers)
        self.assertGreater(commands, 150)
        print(f"{commands} commands, {sum(worker.repeated for worker in workers)} of them repeated")

        # Each volume that was acknowledged and kept is there, and no other.
        for container in CONTAINERS:
            kept = set().union(*(worker.kept[container] for worker in workers))
            self.assertEqual(self.fleet.names(container), at_first[container] | kept)
        self.check_views()
        for worker in workers:
            for container, names in worker.kept.items():
                for name in names:
                    path = worker.host.root / "volumes" / container / name / "content"
                    self.assertEqual(path.read_text(), name)

        # Half of it is removed by the host that has it, half by the next one first: its host lets go of what is left.
        for worker in workers:
            for container, names in worker.kept.items():
                for name in sorted(names):
                    words = ("configlumo", "remove", "-n", name, "-c", CONTAINERS[container])
                    if worker.number % 2 == 1:
                        self.after(worker.host).done(*words)
                    worker.host.done(*words)
        self.check_residue()

    def after(self, host):
        hosts = self.fleet.hosts
        return hosts[(hosts.index(host) + 1) % len(hosts)]

    def mishaps(self, host):
        """What dies in which turn: under the first host the array's server, under the others their daemons."""
        place = self.fleet.hosts.index(host)
        dies = host.kill_and_return if place > 0 else self.fleet.kill_server_and_return
        return dict.fromkeys(range(1 + 2 * place, ROUNDS, 7), dies)

    def test_names_that_all_hosts_want_at_once(self):
        for turn in range(CONTESTED):
            words = ("-n", f"contested-{turn}", "-c", CONTAINERS["archive"])
            made = self.together(lambda host: host.lumo("configlumo", "add", *words, "-s", "1"))
            self.assertEqual(sorted(ended.status for ended in made), [0, 1, 1], "\n".join(map(str, made)))
            for ended in made:
                if ended.status != 0:
                    self.assertRegex(ended.err, r"\Atovicli: [^\n]*already\n\Z")
            gone = self.together(lambda host: host.lumo("configlumo", "remove", *words))
            self.assertEqual(sorted(ended.status for ended in gone), [0, 1, 1], "\n".join(map(str, gone)))
        self.check_views()
        self.check_residue()

    def together(self, action):
        """What each host makes of it, all at the same moment."""
        gate = threading.Barrier(len(self.fleet.hosts))
        ended = {}

        def act(host):
            gate.wait()
            ended[host.name] = action(host)

        threads = [threading.Thread(target=act, args=(host,)) for host in self.fleet.hosts]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        return [ended[host.name] for host in self.fleet.hosts]

    def check_views(self):
        """Every host sees the volumes that the array holds, and the same space taken."""
        for container in CONTAINERS:
            held = self.fleet.volumes(container)
            for host in self.fleet.hosts:
                self.assertEqual(host.sizes(container), held, f"{host.name} sees {container} differently")
                self.assertEqual(set(host.statuses(container).values()) - {"accessible"}, set())

    def check_residue(self):
        """Everything is as it was before the work, bindings too."""
        for host in self.fleet.hosts:
            host.done("daemon", "set", "--unbind-now")
            self.assertEqual(host.directories(), [])
            self.assertEqual(host.strangers(), [])
            self.assertTrue(host.store_is_sound())
        self.assertEqual(self.fleet.everything(), self.before)


@suite.left_unless(LONG, "takes long")
class LoadOnAFile(Load):
    """The same, with the array's file open in each daemon and nobody in between."""

    def url(self):
        return f"file://{self.fleet.array}"


if __name__ == "__main__":
    suite.main()
