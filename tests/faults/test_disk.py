#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""A root on a disk that is full, and on one that is read-only: real ones, mounted for this test alone.

It runs itself again in a mount namespace of its own, which takes no rights where the kernel lets users have one.
"""

import os
import subprocess
import sys
import unittest

from host import GOLD, Host
import suite

UNSHARE = ["unshare", "--map-root-user", "--mount", "--propagation", "private"]
INSIDE = "TOVI_INSIDE"


def mount(*words):
    subprocess.run(["mount", *map(str, words)], check=True)


class Disk(unittest.TestCase):
    def setUp(self):
        self.host = Host()
        self.host.root.mkdir()
        mount("-t", "tmpfs", "-o", "size=1m,mode=755", "tmpfs", self.host.root)
        self.host.__enter__()
        self.addCleanup(self.leave)
        self.assertTrue(self.host.start())
        self.host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", self.host.url)
        self.host.done("storagecontainer", "load")
        self.host.done("configlumo", "add", "-n", "vm", "-c", GOLD)

    def leave(self):
        self.host.stop()
        subprocess.run(["umount", "--recursive", "--lazy", self.host.root], check=True)
        self.host.__exit__()

    def told(self, text, *words):
        ended = self.host.lumo(*words)
        self.assertEqual((ended.status, ended.out), (1, ""), ended)
        self.assertRegex(ended.err, r"\Atovicli: [^\n]*(?:" + text + r")[^\n]*\n\Z")

    def reads_work(self):
        self.host.done("storagecontainer", "load")
        ended = self.host.done("storagecontainer", "checklumos", "-p", str(self.host.root / "volumes/gold"))
        self.assertIn("accessible", ended.out)

    def test_fault_46_a_full_disk(self):
        filler = self.host.root / "volumes/filler"
        with filler.open("wb", buffering=0) as file:
            try:
                while True:
                    file.write(b"x" * 4096)
            except OSError:
                pass
        before = self.host.state()
        full = "the disk is full; it was not changed"
        self.told(full, "orkaprovider", "add", "--vp-name", "other", "--vp-url", "u")
        self.told(full, "configlumo", "add", "-n", "other", "-c", GOLD)
        self.told("No space left on device|" + full, "configlumo", "mount", "-n", "vm", "-c", GOLD)
        self.told(full, "orkaprovider", "remove", "--vp-name", "lab")
        self.reads_work()
        self.assertEqual(self.host.state(), before)
        filler.unlink()
        self.host.done("configlumo", "mount", "-n", "vm", "-c", GOLD)
        self.host.done("orkaprovider", "add", "--vp-name", "other", "--vp-url", "u")
        self.assertEqual(self.host.strangers(), [])

    def test_fault_50_a_read_only_disk(self):
        before = self.host.state()
        mount("--bind", self.host.root, self.host.root)
        mount("-o", "remount,bind,ro", self.host.root)
        self.told("read-only", "orkaprovider", "add", "--vp-name", "other", "--vp-url", "u")
        self.told("read-only|Read-only", "configlumo", "mount", "-n", "vm", "-c", GOLD)
        self.told("read-only|Read-only", "storagecontainer", "remove", "--container-id", GOLD)
        self.reads_work()
        self.assertEqual(self.host.stop(), 0)
        self.assertFalse(self.host.start())
        self.assertEqual(self.host.status, 1)
        self.assertRegex(self.host.daemon_said(), r"\Alumod: [^\n]*Read-only file system\n\Z")
        subprocess.run(["umount", self.host.root], check=True)
        self.assertEqual(self.host.state(), before)
        self.assertTrue(self.host.start())
        self.host.done("configlumo", "mount", "-n", "vm", "-c", GOLD)


if __name__ == "__main__":
    if os.environ.get(INSIDE):
        suite.main()
    if subprocess.run([*UNSHARE, "true"], check=False, capture_output=True).returncode != 0:
        print("skipped: this kernel gives no mount namespace to this user")
        sys.exit(suite.SKIPPED)
    sys.exit(subprocess.run([*UNSHARE, sys.executable, __file__, *sys.argv[1:]], check=False,
                            env={**os.environ, INSIDE: "1"}).returncode)
