#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""An array whose every text means to command the user's terminal, through every command that shows such a text.

In the formats for people nothing but letters reaches the terminal; the formats for programs stay one valid document.
"""

import csv
import io
import json
import re
import sqlite3
import unicodedata
import unittest
import xml.etree.ElementTree

from host import GOLD, Host

try:
    import yaml
except ImportError:
    yaml = None

# Colour, title, clipboard and device-control sequences in both spellings, overwriting, bidirectional overrides, and what
# looks like the end of a document.
HOSTILE = ("\x1b[31mred\x1b]0;title\x07\x1b]52;c;QUJD\x1b\\\x9b2J\x90q\x9c\r\x08\x7f"
           "\u202eback\u2066\u200f\ufeff\t\n--- \"'<&>]]></a>,;|%n{}")
BIDI = "\u202eback\u2066"
FOR_PEOPLE = ("simple", "table", "tree", "keyvalue")


def harmless(text):
    """Whether a terminal shows this and does nothing else."""
    return all(c == "\n" or unicodedata.category(c) not in ("Cc", "Cf", "Cs", "Zl", "Zp") for c in text)


class Fault64HostileText(unittest.TestCase):
    def setUp(self):
        self.host = Host()
        self.host.__enter__()
        self.addCleanup(self.host.__exit__)
        self.assertTrue(self.host.start())
        self.host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", self.host.url)

    def poison(self, statements):
        """Changes texts of the array; a ? stands for the hostile one."""
        database = sqlite3.connect(self.host.array)
        for statement in statements:
            database.execute(statement, [HOSTILE] * statement.count("?"))
        database.commit()
        database.close()

    def check_formats(self, words, shown=HOSTILE, json_has_it=True):
        """Every format of a command's output; it is run again for each, on the host as it was saved."""
        sign = shown[0].encode("unicode_escape").decode()
        for name in FOR_PEOPLE:
            ended = self.formatted(name, words)
            self.assertTrue(harmless(ended.out + ended.err), f"{name}: {ended.out + ended.err!r}")
            self.assertEqual(ended.status, 0, ended)
            self.assertRegex(ended.out.lower(), re.escape(sign) + r"|\\u001b", name)
        for name, read in (("json", json.loads), ("xml", xml.etree.ElementTree.fromstring),
                           ("yaml", yaml.safe_load if yaml else None), ("csv", self.read_csv)):
            ended = self.formatted(name, words)
            self.assertTrue(harmless(ended.err), f"{name}: {ended.err!r}")
            if ended.status == 2:
                # A format that cannot hold this kind of result says so instead of leaving something out.
                self.assertEqual(ended.out, "", name)
                self.assertNotEqual(name, "json")
            elif read:
                self.assertEqual(ended.status, 0, ended)
                document = read(ended.out)
                if name == "json" and json_has_it:
                    self.assertIn(shown, self.texts(document))

    def formatted(self, name, words):
        self.host.restore()
        return self.host.tool("--format", name, "storage", "internal", "lumo", *words)

    def read_csv(self, text):
        rows = list(csv.reader(io.StringIO(text, newline=""), strict=True))
        self.assertEqual(len({len(row) for row in rows}), 1, rows)

    def texts(self, value):
        """All texts in a JSON document."""
        if isinstance(value, dict):
            return [text for member in value.values() for text in self.texts(member)]
        if isinstance(value, list):
            return [text for member in value for text in self.texts(member)]
        return [value]

    def refused(self, *words):
        """A failure whose sentence holds such a text: one harmless line."""
        ended = self.host.lumo(*words)
        self.assertNotEqual(ended.status, 0, ended)
        self.assertTrue(harmless(ended.out + ended.err), repr(ended.out + ended.err))
        self.assertEqual(ended.err.count("\n"), 1, ended)
        return ended

    def test_fault_64_storage_arrays_and_endpoints(self):
        self.poison(["UPDATE storage_array SET name = ?, vendor_id = ?, model_id = ?",
                     "UPDATE endpoint SET text1 = ?, text2 = ?", "UPDATE endpoint_address SET address = ?"])
        self.host.save()
        self.check_formats(["storagecontainer", "load"])

    def test_fault_64_ids_of_arrays_and_endpoints(self):
        self.poison(["UPDATE storage_array SET id = ? WHERE seq = 1",
                     "UPDATE endpoint SET uid = ? WHERE seq = (SELECT min(seq) FROM endpoint WHERE uid IS NOT NULL)"])
        self.host.save()
        self.check_formats(["storagecontainer", "load"])
        self.host.restore()
        self.host.done("storagecontainer", "load")
        ended = self.host.lumo("daemon", "set", "--start-pe-apd", HOSTILE)
        self.assertTrue(harmless(ended.out + ended.err), repr(ended.out + ended.err))

    def test_fault_64_names_of_containers(self):
        # A directory may have such a name; one with control characters is refused.
        self.poison([f"UPDATE container SET name = '{BIDI}' WHERE id = '{GOLD}'"])
        self.host.save()
        self.check_formats(["storagecontainer", "load"], shown=BIDI)
        endpoint = self.host.rows(self.host.array, "SELECT uid FROM endpoint WHERE uid IS NOT NULL ORDER BY seq")[0][0]
        for option in ("--start-pe-apd", "--end-pe-apd"):
            ended = self.host.lumo("daemon", "set", option, endpoint)
            self.assertTrue(harmless(ended.out + ended.err), repr(ended.out + ended.err))
            self.assertIn("u202eback", ended.out + ended.err)
        self.assertIn("u202eback", self.refused("configlumo", "umount", "-n", "none", "-c", GOLD).err)

    def test_fault_64_a_container_that_cannot_be_mounted(self):
        self.poison([f"UPDATE container SET name = ? WHERE id = '{GOLD}'"])
        self.assertIn(r"\x1b", self.refused("storagecontainer", "load").err)

    def test_fault_64_volumes(self):
        self.poison(["UPDATE volume SET profile = ?", "UPDATE metadata SET key = ?, value = ?"])
        uuid = self.host.rows(self.host.array, "SELECT uuid FROM volume WHERE directory_name = 'web-01'")[0][0]
        self.host.done("storagecontainer", "load")
        self.host.save()
        self.check_formats(["virtualvolume", "get", "-c", GOLD, "-u", uuid])
        self.check_formats(["virtualvolume", "metadata", "list", "-c", GOLD, "-u", uuid])

    def test_fault_64_bytes_that_are_no_utf8(self):
        # A byte of no character, a control sequence, a slash in too many bytes, half of a surrogate pair.
        self.poison(["UPDATE storage_array SET name = CAST(X'66FF1B5B41C0AFEDA080' AS TEXT)",
                     "UPDATE metadata SET value = CAST(X'66FF1B5B41C0AFEDA080' AS TEXT)"])
        uuid = self.host.rows(self.host.array, "SELECT uuid FROM volume WHERE directory_name = 'web-01'")[0][0]
        self.host.save()
        shown = "f\\xff\x1b[A\\xc0\\xaf\\xed\\xa0\\x80"
        for words in (["storagecontainer", "load"], ["virtualvolume", "metadata", "list", "-c", GOLD, "-u", uuid]):
            self.assertIn(r"f\xff\x1b[A\xc0\xaf\xed\xa0\x80", self.formatted("simple", words).out)
            self.assertIn(shown, self.texts(json.loads(self.formatted("json", words).out)))
            for name in ("table", "tree", "keyvalue", "xml", "yaml", "csv"):
                ended = self.formatted(name, words)  # which reads it as UTF-8
                self.assertIn(ended.status, (0, 2), ended)

    def test_fault_64_ids_of_volumes(self):
        evil = "\x1b[31m\u202e" + "x" * 30
        self.poison([f"UPDATE volume SET uuid = '{evil}' WHERE directory_name = 'web-02'"])
        self.host.done("storagecontainer", "load")
        self.host.save()
        for name in FOR_PEOPLE + ("json", "xml", "yaml", "csv"):
            ended = self.formatted(name, ["storagecontainer", "checklumos", "-p", str(self.host.root / "volumes/gold")])
            self.assertTrue(harmless(ended.err), f"{name}: {ended.err!r}")
            self.assertNotIn("x" * 30, ended.out, name)
            if ended.status != 2:
                # An id that is none is not shown: the file is not what it says.
                self.assertEqual(ended.status, 0, ended)
                self.assertIn("is damaged: a virtual volume has an id that is none", ended.err, name)
        self.refused("configlumo", "mount", "-n", "web-02", "-c", GOLD)

    def test_fault_64_names_of_volumes(self):
        self.poison(["UPDATE volume SET directory_name = ? WHERE directory_name = 'web-01'"])
        uuid = self.host.rows(self.host.array, "SELECT uuid FROM volume WHERE directory_name LIKE '%red%'")[0][0]
        self.host.done("storagecontainer", "load")
        self.refused("configlumo", "mount", "-u", uuid, "-c", GOLD)
        self.refused("configlumo", "add", "-n", "large\nname", "-c", GOLD)
        self.refused("orkaprovider", "activate", "--vp-name", "a\ttab\nand a line", "--arrayid", "x\ny")
        self.refused("configlumo", "mount", "-n", HOSTILE, "-c", GOLD)
        self.assertEqual([p.name for p in (self.host.root / "volumes/gold").iterdir()], [])


if __name__ == "__main__":
    unittest.main()
