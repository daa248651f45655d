#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The playbook of lab/fleet on three hosts of one array: it does what is missing, then nothing, and tells in one line
what went wrong where. TOVI_LONG=1 runs it; without, it is only read."""

import os
import re
import shutil
import subprocess
import unittest

from fleet import CONTAINERS, NAMES, TOP, Fleet, build, kill
import suite

LONG = os.environ.get("TOVI_LONG") == "1"
PLAYBOOK = shutil.which("ansible-playbook")
RECAP = re.compile(r"^(\w+) +: (.*)$", re.MULTILINE)


class Run:
    """What a run of the playbook told: counts of each host, lines of failures."""

    def __init__(self, done):
        self.status, self.out = done.returncode, done.stdout
        recap = done.stdout.partition("PLAY RECAP")[2]
        self.hosts = {name: {key: int(value) for key, value in (pair.split("=") for pair in counts.split())}
                      for name, counts in RECAP.findall(recap)}
        self.failures = re.findall(r"^fatal: .*$", done.stdout, re.MULTILINE)

    def of(self, count):
        return {name: counts[count] for name, counts in self.hosts.items()}


@unittest.skipUnless(PLAYBOOK, "there is no ansible-playbook here")
class Playbook(unittest.TestCase):
    def setUp(self):
        self.fleet = self.enterContext(Fleet())

    def play(self, *words):
        scratch = self.fleet.directory / "ansible"
        environment = {key: value for key, value in os.environ.items() if not key.startswith(("TOVI_", "ANSIBLE_"))}
        environment.update(FLEET=str(self.fleet.directory), PATH=f"{build() / 'bin'}:{os.environ['PATH']}",
                           ANSIBLE_NOCOLOR="1", ANSIBLE_HOME=str(scratch), ANSIBLE_LOCAL_TEMP=str(scratch / "local"),
                           ANSIBLE_REMOTE_TMP=str(scratch / "remote"), LC_ALL="C.UTF-8")
        done = subprocess.run([PLAYBOOK, "storage.yml", *words], cwd=TOP / "lab/fleet", env=environment, text=True,
                              stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, check=False,
                              timeout=600)
        return Run(done)

    def test_it_reads_well(self):
        read = self.play("--syntax-check")
        self.assertEqual(read.status, 0, read.out)
        listed = self.play("--list-hosts")
        self.assertEqual(sorted(listed.out.partition("hosts (3):")[2].split()), sorted(NAMES), listed.out)

    @suite.left_unless(LONG, "takes long")
    def test_it_does_what_is_missing_and_nothing_else(self):
        first = self.play()
        self.assertEqual((first.status, first.of("failed")), (0, dict.fromkeys(NAMES, 0)), first.out)
        self.assertTrue(all(changed >= 2 for changed in first.of("changed").values()), first.out)
        for host in self.fleet.hosts:
            for container in CONTAINERS:
                self.assertEqual(host.sizes(container), self.fleet.volumes(container))
        second = self.play()
        self.assertEqual((second.status, second.of("changed")), (0, dict.fromkeys(NAMES, 0)), second.out)

        # A provider at another URL than the one that is wanted is registered anew, where it is.
        self.fleet.hosts[1].done("orkaprovider", "remove", "--vp-name", "lab")
        self.fleet.hosts[1].done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", "https://127.0.0.1:9/orka")
        third = self.play()
        self.assertEqual((third.status, third.of("changed")), (0, {"a": 0, "b": 2, "c": 0}), third.out)

    @suite.left_unless(LONG, "takes long")
    def test_a_host_that_fails_fails_alone_and_in_one_line(self):
        first, dead, cut_off = self.fleet.hosts
        kill(int((dead.root / "run/lumod.pid").read_text()))
        run = self.play()
        self.assertEqual((run.status, run.of("failed")), (2, {"a": 0, "b": 1, "c": 0}), run.out)
        self.assertEqual(len(run.failures), 1, run.out)
        self.assertIn('"msg": "Mounting its containers: the daemon or a plug-in is not to be had: Unable to load Lumo '
                      f'datastores: no daemon answers at {dead.root}/run/lumod.sock"', run.failures[0])
        self.assertEqual(cut_off.sizes("gold"), self.fleet.volumes("gold"))

        dead.up()
        for endpoint in ("pe-north-scsi-1", "pe-north-nfs-1"):
            cut_off.lumo("daemon", "set", "--start-pe-apd", endpoint)
        again = self.play()
        self.assertEqual((again.status, again.of("failed")), (2, {"a": 0, "b": 0, "c": 1}), again.out)
        self.assertEqual(len(again.failures), 1, again.out)
        self.assertRegex(again.failures[0], r"not accessible: [0-9a-f-]{36} \(inaccessible\), ")
        self.assertEqual(set(first.statuses("gold").values()), {"accessible"})


if __name__ == "__main__":
    suite.main()
