#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Many clients, greedy clients, very many calls: others are answered, and the daemon does not grow.

With TOVI_LONG the calls are a million; without, twenty thousand.
"""

import os
import resource
import subprocess
import time
import unittest

import wire
from host import GOLD, TOP, Host, programs
import suite

LONG = bool(os.environ.get("TOVI_LONG"))
MIB = 1 << 20


def resident(pid):
    """Bytes of a process's memory that are in use."""
    with open(f"/proc/{pid}/statm", encoding="ascii") as file:
        return int(file.read().split()[1]) * resource.getpagesize()


def descriptors(pid):
    return len(os.listdir(f"/proc/{pid}/fd"))


class Crowds(unittest.TestCase):
    def serve(self, box):
        self.assertTrue(box.start())
        box.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", box.url)
        return box.daemon.pid

    def test_fault_60_a_thousand_clients_and_one_that_floods(self):
        soft, hard = resource.getrlimit(resource.RLIMIT_NOFILE)
        resource.setrlimit(resource.RLIMIT_NOFILE, (hard, hard))
        try:
            with Host() as box:
                self.flood(box)
        finally:
            resource.setrlimit(resource.RLIMIT_NOFILE, (soft, hard))

    def flood(self, box):
        # Answers worth flooding with: a few MiB each.
        topology = box.directory / "large.json"
        with topology.open("w") as file:
            subprocess.run([TOP / "lab/generate-topology", "--containers", "20000", "--arrays", "2",
                            "--endpoints", "2"], stdout=file, check=True)
        box.array.unlink()
        self.assertEqual(box.run(programs() / "orkasim", "make", topology, box.array).status, 0)
        pid = self.serve(box)
        request = wire.recorded_request(box, "storagecontainer", "load")
        clients = [wire.Client(box) for _ in range(1000)]
        clients[0].send(request)
        clients[0].messages(2)
        before = resident(pid)
        flooder = wire.Client(box)
        flooded = flooder.fill(request * 1000)  # and never reads
        self.assertGreater(flooded, len(request) * 100)
        for client in clients[1:21]:
            client.send(request)
            client.messages(21)
        # The flooder holds one request and one reply message, however much more it sends.
        self.hold(resident(pid) - before, 16 * MIB)
        # So do those who ask and do not read: not their whole answers, which would be 3.4 GiB.
        for client in clients[21:]:
            client.send(request)
        probe = wire.Client(box)
        probe.send(request)
        probe.messages(21)
        self.hold(resident(pid) - before, 1000 * MIB // 2)
        began = time.monotonic()
        # A tool among them asks about a container, which only the daemon can tell, and is answered.
        name, container = box.rows(box.array, "SELECT name, id FROM container LIMIT 1")[0]
        box.done("storagecontainer", "add", "--container-name", name, "--container-id", container)
        self.assertLess(time.monotonic() - began, 10)
        for client in [*clients, flooder, probe]:
            client.close()
        asked = wire.Client(box)
        asked.send(request)
        asked.messages(21)
        asked.close()
        box.stop()

    def test_fault_62_many_calls_leave_nothing_behind(self):
        calls, batch = (1_000_000, 200) if LONG else (20_000, 200)
        with Host() as box:
            pid = self.serve(box)
            read = wire.recorded_request(box, "storagecontainer", "load")
            told = len(self.answers(box, read, 1, 2)[0])
            self.assertGreater(told, 200)
            marks = []
            for done in range(0, calls, batch):
                if done in (calls // 4 // batch * batch, calls // 2):
                    marks.append((resident(pid), descriptors(pid)))
                # A new connection for every batch; some of them leave in the middle of their answers.
                self.answers(box, read, batch, 2 * batch if done % (10 * batch) else batch)
            self.answers(box, read, 1, 2)
            marks.append((resident(pid), descriptors(pid)))
            self.hold(marks[-1][0] - marks[0][0], MIB, marks)
            # The last of those who left may not have been noticed yet.
            self.assertLessEqual(marks[-1][1], marks[0][1] + 2, marks)
            self.assertEqual(box.stop(), 0)

    def hold(self, grown, room, told=None):
        """The daemon has grown by less than that. What sanitizers keep for themselves is not the daemon's."""
        if not suite.SANITIZED:
            self.assertLess(grown, room, told)

    @suite.left_unless(not suite.SANITIZED, "a sanitizer opens a pipe to look at an object, and takes a refusal for a fault")
    def test_fault_62_a_tool_without_descriptors(self):
        with Host() as box:
            self.serve(box)
            box.done("storagecontainer", "load")
            for limit in range(3, 24):
                words = ["configlumo", "mount", "-n", "none", "-c", GOLD]
                ended = box.run("prlimit", f"--nofile={limit}", programs() / "tovicli", "storage", "internal", "lumo", *words)
                if "error while loading shared libraries" in ended.err:
                    continue  # the system's own failure, before the tool's first instruction
                self.assertIn(ended.status, (1, 3), f"{limit} descriptors: {ended}")
                self.assertRegex(ended.err, r"\A(tovicli: [^\n]+\n)+\Z", f"{limit} descriptors")
            self.assertIn("none", ended.err, "with so many it works")

    def answers(self, box, request, count, messages):
        client = wire.Client(box)
        client.send(request * count)
        taken = client.messages(messages)
        client.close()
        return taken


if __name__ == "__main__":
    suite.main()
