#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Several tools that want the same thing at the same moment: it happens once, and whoever comes too late is told so."""

import collections
import ctypes
import os
import subprocess
import threading
import unittest

from host import ARCHIVE, GOLD, Host, programs

VOLUME = ("-n", "vm", "-c", GOLD)
ROUNDS = 3


class Fault59Rivals(unittest.TestCase):
    def together(self, host, *words, rivals=4):
        """Runs the same command several times at once. @return how each ended: status and what it said on stderr"""
        running = [subprocess.Popen([str(programs() / "tovicli"), "storage", "internal", "lumo", *words],
                                    env=host.environment, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                                    stderr=subprocess.PIPE) for _ in range(rivals)]
        ended = []
        for one in running:
            _, err = one.communicate(timeout=60)
            ended.append((one.returncode, err.decode()))
        return ended

    def once(self, host, words, refusal):
        """Exactly one succeeds, and the others say why they do not."""
        ended = self.together(host, *words)
        self.assertEqual([status for status, _ in ended].count(0), 1, ended)
        for status, err in ended:
            if status != 0:
                self.assertEqual(status, 1, err)
                self.assertRegex(err, r"\Atovicli: [^\n]*" + refusal + r"[^\n]*\n\Z")

    def check(self, host, mounted, containers=3):
        state = host.state()
        self.assertEqual([name for _, name in state["mounted"]], mounted)
        self.assertEqual(len(state["containers"]), containers)
        self.assertTrue(host.sound(host.root / "host.db"))
        self.assertTrue(host.sound(host.array))
        self.assertEqual(host.strangers(), [])

    def test_fault_59_config_volumes(self):
        with Host() as host:
            self.assertTrue(host.start())
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
            host.done("storagecontainer", "load")
            for _ in range(ROUNDS):
                self.once(host, ["configlumo", "add", *VOLUME], "already")
                self.once(host, ["configlumo", "mount", *VOLUME], "(is mounted already|is in the way)")
                self.check(host, ["vm"])
                (host.root / "volumes/gold/vm/file").write_text("precious")
                self.once(host, ["configlumo", "umount", *VOLUME], "mounted")
                self.check(host, [])
                host.done("configlumo", "mount", *VOLUME)
                self.assertEqual((host.root / "volumes/gold/vm/file").read_text(), "precious")
                ended = self.together(host, "configlumo", "remove", *VOLUME)
                # A removal also finishes what another one has begun, so more than one may have done it.
                self.assertIn(0, [status for status, _ in ended], ended)
                self.check(host, [])
                self.assertFalse((host.root / "volumes/gold/vm").exists())

    def test_fault_59_containers(self):
        with Host() as host:
            self.assertTrue(host.start())
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
            for _ in range(ROUNDS):
                ended = self.together(host, "storagecontainer", "load")
                # Loads that meet share the work, or find a container taken and say so; all are mounted in the end.
                host.done("storagecontainer", "load")
                self.assertTrue(all(status in (0, 1) for status, _ in ended), ended)
                self.check(host, [])
                self.assertEqual(sorted(p.name for p in (host.root / "volumes").iterdir()), ["archive", "gold", "silver"])
                self.once(host, ["storagecontainer", "remove", "--container-id", ARCHIVE], "")
                self.check(host, [], containers=2)
                self.assertFalse((host.root / "volumes/archive").exists())
                host.done("storagecontainer", "remove", "--container-id", GOLD)

    def test_fault_59_a_volume_is_mounted_and_its_container_removed(self):
        with Host() as host:
            self.assertTrue(host.start())
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
            host.done("storagecontainer", "load")
            host.done("configlumo", "add", *VOLUME)
            for _ in range(ROUNDS * 3):
                mount, remove = (subprocess.Popen([str(programs() / "tovicli"), "storage", "internal", "lumo", *words],
                                                  env=host.environment, stdin=subprocess.DEVNULL,
                                                  stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
                                 for words in (["configlumo", "mount", *VOLUME],
                                               ["storagecontainer", "remove", "--container-id", GOLD]))
                results = mount.wait(60), remove.wait(60)
                self.assertEqual(sorted(results), [0, 1], "both or neither")
                if results[0] == 0:
                    self.check(host, ["vm"])
                    self.assertTrue((host.root / "volumes/gold/vm").is_dir())
                    host.done("configlumo", "umount", *VOLUME)
                else:
                    self.check(host, [], containers=2)
                    host.done("storagecontainer", "load")


def exchange(one, other):
    """Two names change places in one step."""
    at_cwd, flag = -100, 2
    libc = ctypes.CDLL(None, use_errno=True)
    if libc.renameat2(at_cwd, os.fsencode(one), at_cwd, os.fsencode(other), flag) != 0:
        raise OSError(ctypes.get_errno(), "renameat2")


class Fault54LinkInThePath(unittest.TestCase):
    def test_fault_54_a_link_raced_into_the_path(self):
        """Somebody swaps a container's directory for a link to elsewhere, again and again, while tools work in it."""
        with Host() as host:
            self.assertTrue(host.start())
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
            host.done("storagecontainer", "load")
            host.done("configlumo", "add", *VOLUME)
            gold, link = host.root / "volumes/gold", host.root / "volumes/link"
            outside = host.directory / "outside"
            (outside / "vm").mkdir(parents=True)
            (outside / "vm" / "file").write_text("precious")
            link.symlink_to(outside)
            ending = threading.Event()

            def swap():
                while not ending.is_set():
                    exchange(gold, link)

            swapper = threading.Thread(target=swap)
            swapper.start()
            statuses = collections.Counter()
            try:
                for _ in range(15):
                    for command in ("mount", "umount", "remove", "add"):
                        statuses[command, host.lumo("configlumo", command, *VOLUME).status] += 1
            finally:
                ending.set()
                swapper.join()
            self.assertEqual([str(p.relative_to(outside)) for p in sorted(outside.rglob("*"))], ["vm", "vm/file"])
            self.assertEqual((outside / "vm/file").read_text(), "precious")
            self.assertTrue({status for _, status in statuses} <= {0, 1}, statuses)
            # The race was a race: some came through and some did not.
            self.assertGreater(statuses["mount", 0], 0, statuses)
            self.assertGreater(sum(n for (_, status), n in statuses.items() if status), 0, statuses)


if __name__ == "__main__":
    unittest.main()
