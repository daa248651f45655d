#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""What each of three hosts of one array sees of it, and of what the others do."""

import json
import os
import subprocess
import unittest

from fleet import CONTAINERS, GOLD, TOP, Fleet, build, kill

VM = ("-n", "vm", "-c", GOLD)


class Views(unittest.TestCase):
    def setUp(self):
        self.fleet = self.enterContext(Fleet())
        self.fleet.join()
        self.a, self.b, self.c = self.fleet.hosts

    def uuid(self, name):
        known = self.a.statuses("gold")
        for uuid in known:
            pairs = self.a.json("virtualvolume", "metadata", "list", "-c", GOLD, "-u", uuid)
            if {"key": "directoryName", "value": name} in pairs:
                return uuid
        self.fail(f"{name} is not among {known}")

    def refused(self, ended, text):
        self.assertEqual(ended.status, 1, ended)
        self.assertIn(text, ended.err)

    def gold(self, host):
        return host.root / "volumes/gold"

    def test_every_host_has_every_container_and_the_same_volumes(self):
        for host in self.fleet.hosts:
            self.assertEqual(sorted(path.name for path in (host.root / "volumes").iterdir()), sorted(CONTAINERS))
            self.assertEqual(host.json("storagecontainer", "load"), [], "all are mounted already")
            for container in CONTAINERS:
                self.assertEqual(host.sizes(container), self.fleet.volumes(container))
                self.assertEqual(set(host.statuses(container).values()) - {"accessible"}, set())

    def test_a_volume_that_one_host_has_mounted(self):
        self.a.done("configlumo", "add", *VM, "-s", "256")
        self.a.done("configlumo", "mount", *VM)
        (self.gold(self.a) / "vm/disk").write_text("of a")
        uuid = self.uuid("vm")
        for host in self.fleet.hosts:
            facts = host.json("virtualvolume", "get", "-c", GOLD, "-u", uuid)
            self.assertEqual((facts["Lumo UUID"], facts["Logical Size"]), (uuid, 256))
            self.assertEqual(host.statuses("gold")[uuid], "accessible")
        self.assertEqual(self.b.directories() + self.c.directories(), [])
        self.refused(self.b.lumo("configlumo", "add", *VM), "has a config volume 'vm' already")
        self.refused(self.b.lumo("configlumo", "umount", *VM), "no config volume named 'vm' is mounted")
        self.assertEqual((self.gold(self.a) / "vm/disk").read_text(), "of a")
        self.assertIn("vm", self.fleet.bound())

    def test_an_array_does_not_tell_hosts_apart(self):
        """A volume belongs on one host at a time, and nothing but its users sees to it: docs/fleet.md says so."""
        self.a.done("configlumo", "add", *VM)
        self.a.done("configlumo", "mount", *VM)
        (self.gold(self.a) / "vm/disk").write_text("of a")
        self.b.done("configlumo", "mount", *VM)
        self.assertEqual(list((self.gold(self.b) / "vm").iterdir()), [], "a directory is its host's")
        uuid = self.uuid("vm")
        self.c.done("configlumo", "remove", *VM)
        self.assertNotIn("vm", self.fleet.names("gold"))
        # What a has is still there until a lets go of it, and a can see that the volume is not.
        self.assertEqual((self.gold(self.a) / "vm/disk").read_text(), "of a")
        row = self.a.json("storagecontainer", "checklumos", "--path", self.gold(self.a), "--lumo", uuid)
        self.assertEqual([one["Status"] for one in row], ["non-existent"])
        self.a.done("configlumo", "remove", *VM)
        self.b.done("configlumo", "umount", *VM)
        self.assertEqual(self.a.directories() + self.c.directories(), [])

    def test_one_host_after_the_other(self):
        """What stands in for moving a volume: its content stays with the host, its name, size and profile go along."""
        self.a.done("configlumo", "add", *VM, "-s", "64")
        for host in self.fleet.hosts:
            host.done("configlumo", "mount", *VM)
            (self.gold(host) / "vm/who").write_text(host.name)
            host.done("configlumo", "umount", *VM)
            host.done("daemon", "set", "--unbind-now")
            self.assertNotIn("vm", self.fleet.bound())
        for host in self.fleet.hosts:
            host.done("configlumo", "mount", *VM)
            self.assertEqual((self.gold(host) / "vm/who").read_text(), host.name)
            host.done("configlumo", "umount", *VM)

    def test_a_host_that_has_let_go_may_unbind_what_another_one_has(self):
        """Why --unbind-now comes before a move; without it a volume stays accessible, and its binding is gone."""
        self.a.done("configlumo", "add", *VM)
        self.a.done("configlumo", "mount", *VM)
        self.a.done("configlumo", "umount", *VM)
        self.b.done("configlumo", "mount", *VM)
        self.assertIn("vm", self.fleet.bound())
        self.a.done("daemon", "set", "--unbind-now")
        self.assertNotIn("vm", self.fleet.bound())
        self.assertEqual(self.b.statuses("gold")[self.uuid("vm")], "accessible")
        self.b.done("configlumo", "umount", *VM)
        self.b.done("configlumo", "mount", *VM)
        self.assertIn("vm", self.fleet.bound())

    def test_an_outage_is_one_host_s(self):
        self.a.done("configlumo", "add", *VM)
        self.a.done("configlumo", "mount", *VM)
        uuid = self.uuid("vm")
        usable = {self.fleet.bound()["vm"], "pe-north-scsi-1", "pe-north-nfs-1"}
        for endpoint in usable:
            ended = self.b.lumo("daemon", "set", "--start-pe-apd", endpoint)
            self.refused(ended, "Notify PE APD command returned containers: ")
        seen = {host.name: host.statuses("gold")[uuid] for host in self.fleet.hosts}
        self.assertEqual(seen, {"a": "accessible", "b": "inaccessible", "c": "accessible"})
        self.refused(self.b.lumo("configlumo", "mount", *VM), "no protocol endpoint")
        self.b.done("configlumo", "add", "-n", "other", "-c", GOLD)
        self.c.done("configlumo", "mount", "-n", "other", "-c", GOLD)
        self.assertLess({"other", "vm"}, set(self.fleet.bound()))
        for endpoint in usable:
            self.b.lumo("daemon", "set", "--end-pe-apd", endpoint)
        self.assertEqual(self.b.statuses("gold")[uuid], "accessible")

    def test_what_was_so_already_has_a_status_and_a_code(self):
        """What docs/fleet.md tells programs to look at."""
        repeated = [(["configlumo", "add", *VM], 26), (["configlumo", "mount", *VM], 26),
                    (["configlumo", "umount", *VM], 24), (["configlumo", "remove", *VM], 24),
                    (["storagecontainer", "remove", "--container-id", GOLD], 23),
                    (["orkaprovider", "remove", "--vp-name", "lab"], 21)]
        for words, code in repeated:
            self.a.done(*words)
            again = self.a.tool("--format", "json", "storage", "internal", "lumo", *words)
            self.assertEqual((again.status, json.loads(again.err)["error"]["code"]), (1, code), again)
        self.a.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", self.a.url)
        self.refused(self.a.lumo("orkaprovider", "add", "--vp-name", "lab", "--vp-url", self.a.url), "already exists")

    def test_a_list_that_cannot_be_asked_for_is_empty_and_says_so(self):
        kill(int((self.a.root / "run/lab.orkasim").read_text().split()[0]))
        for host in self.fleet.hosts:
            told = host.tool("--format", "json", "storage", "internal", "lumo", "storagecontainer", "checklumos",
                             "--path", self.gold(host))
            self.assertEqual((told.status, json.loads(told.out)), (0, []))
            self.assertRegex(json.loads(told.err)["warnings"][0], r"\Athe provider at \S+ cannot be reached: ")

    def test_an_endpoint_that_two_hosts_can_use_is_kept(self):
        """A host that cannot use the endpoint of a volume takes another one, for all."""
        self.a.done("configlumo", "add", *VM)
        self.a.done("configlumo", "mount", *VM)
        first = self.fleet.bound()["vm"]
        self.c.done("configlumo", "mount", *VM)
        self.assertEqual(self.fleet.bound()["vm"], first)
        self.b.lumo("daemon", "set", "--start-pe-apd", first)
        self.b.done("configlumo", "mount", *VM)
        self.assertNotEqual(self.fleet.bound()["vm"], first)
        self.assertEqual(self.a.statuses("gold")[self.uuid("vm")], "accessible")

    def test_a_host_is_brought_up_beside_one_that_is_up_with_https_only(self):
        def refused(status, text, *words):
            told = subprocess.run([TOP / "lab/up", "--build", build(), "--root", self.fleet.directory / "d", *words],
                                  check=False, capture_output=True, text=True)
            self.assertEqual((told.returncode, told.stdout), (status, "false\n"), told.stderr)
            self.assertIn(text, told.stderr)

        refused(1, "no orkasim serves the array of ", "--beside", self.b.root)
        refused(1, "there is no root ", "--beside", self.fleet.directory / "nowhere")
        refused(2, "--beside goes without --https, --topology and --name", "--beside", self.a.root, "--https")

    def test_the_document_shows_what_happens(self):
        run = subprocess.run(["python3", TOP / "tests/cli/run_tour.py", TOP / "docs/fleet.md"], cwd=TOP, check=False,
                             env={**os.environ, "TMPDIR": str(self.fleet.directory)}, capture_output=True, text=True)
        self.assertEqual(run.returncode, 0, run.stdout)


if __name__ == "__main__":
    unittest.main()
