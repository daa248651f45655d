#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""What somebody else puts in the place of a database's journal: no file is removed for it, and nothing waits for it."""

import os
import struct
import unittest

from host import Host
import suite

MAGIC = bytes.fromhex("d9d505f920a163d7")
SECTOR, PAGE = 512, 4096


def journal_that_names(victim, database):
    """A journal that takes nothing back and asks for a file to be removed once it is done."""
    name = os.fsencode(victim)
    head = MAGIC + struct.pack(">5I", 0, 1, database.stat().st_size // PAGE, SECTOR, PAGE)
    return (head.ljust(SECTOR, b"\0") + struct.pack(">I", (1 << 30) // PAGE + 1) + name
            + struct.pack(">2I", len(name), sum(name)) + MAGIC)


class Journals(unittest.TestCase):
    def setUp(self):
        self.box = self.enterContext(Host())
        self.box.environment["TOVI_TIMEOUT_MS"] = "3000"
        self.assertTrue(self.box.start())
        self.box.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", self.box.url)
        self.box.done("storagecontainer", "load")
        self.store = self.box.root / "host.db"

    def journal_of(self, database):
        return database.with_name(database.name + "-journal")

    def plant_victim(self, database):
        victim = self.box.directory / "victim"
        victim.write_text("precious")
        self.journal_of(database).write_bytes(journal_that_names(victim, database))
        return victim

    def plant_pipe(self, database):
        pipe = self.journal_of(database)
        os.mkfifo(pipe)
        return pipe

    def refused(self, ended, *reasons, status=1):
        """One line, which says why."""
        self.assertEqual(ended.status, status, ended)
        self.assertRegex(ended.err, r"\Atovicli: [^\n]+\n\Z")
        for reason in reasons:
            self.assertIn(str(reason), ended.err)

    def add_provider(self):
        return self.box.lumo("orkaprovider", "add", "--vp-name", "more", "--vp-url", "file:///nowhere")

    def test_fault_52_the_tool_removes_no_file_for_a_journal(self):
        victim = self.plant_victim(self.store)
        self.refused(self.add_provider(), self.store, "that file was left alone")
        self.assertEqual(victim.read_text(), "precious")
        self.assertEqual(self.add_provider().status, 0)
        self.assertEqual(victim.read_text(), "precious")

    def test_fault_52_the_daemon_removes_no_file_for_an_arrays_journal(self):
        self.box.stop()
        self.assertTrue(self.box.start())  # has nothing of the array in memory
        victim = self.plant_victim(self.box.array)
        told = self.box.lumo("storagecontainer", "load")
        self.assertEqual(victim.read_text(), "precious")
        self.assertIn(str(self.box.array), told.err)
        self.assertIn("that file was left alone", told.err)
        self.box.done("storagecontainer", "load")
        self.assertEqual(self.box.stop(), 0)

    def test_fault_52_doctor_removes_no_file_for_a_journal(self):
        self.box.stop()  # it would look at the store, too
        victim = self.plant_victim(self.store)
        before = self.journal_of(self.store).read_bytes()
        told = self.box.tool("cli", "doctor")
        self.assertNotEqual(told.status, 0, told)
        self.assertIn("that file was left alone", told.out)
        self.assertEqual(victim.read_text(), "precious")
        self.assertEqual(self.journal_of(self.store).read_bytes(), before)

    def test_fault_52_the_tool_waits_for_no_pipe(self):
        pipe = self.plant_pipe(self.store)
        self.refused(self.add_provider(), self.store, "no regular file")
        told = self.box.tool("cli", "doctor")
        self.assertNotEqual(told.status, 0, told)
        self.assertIn(f"'{pipe}' is no regular file", told.out)

    def test_fault_52_the_daemon_waits_for_no_pipe(self):
        self.plant_pipe(self.box.array)
        told = self.box.lumo("storagecontainer", "load")
        self.assertIn(str(self.box.array), told.err)
        self.assertIn("no regular file", told.err)
        # It answers whom no array is asked for, and it goes when it is told to.
        self.box.done("daemon", "set", "--log-level", "info")
        self.assertEqual(self.box.stop(), 0)

    def test_fault_52_the_daemon_waits_for_no_pipe_beside_the_store(self):
        self.plant_pipe(self.store)
        self.refused(self.box.lumo("storagecontainer", "load"), self.store, "no regular file")
        self.assertEqual(self.box.stop(), 0)


if __name__ == "__main__":
    suite.main()
