# SPDX-License-Identifier: Apache-2.0
"""The arithmetic of tools/bench and tools/profile, and what they make of docs/benchmarks.md."""

import pathlib
import subprocess
import sys
import tempfile
import types
import unittest

TOP = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.insert(0, str(TOP / "bench"))

from harness import document, plot, profile, suite  # noqa: E402
from harness.figures import Report, quartiles, verdict, written  # noqa: E402

MACHINE = {"processor": "P", "cores": 2, "kernel": "6.1", "memory": "4.0 GiB"}
MOMENT = {"revision": "aaaa", "date": "2026-01-02 03:04 UTC", "load": 0.1}
LATER = {"revision": "bbbb", "date": "2026-01-03 03:04 UTC", "load": 0.2}


def report(*rows, out=None):
    made = Report(out or (lambda _: None))
    for name, value in rows:
        made.line(name, value, value, value, 2.0, 3.0, "")
    return made


def fresh(made, moment=MOMENT, machine=None):
    return document.stamped(made, moment, machine or MACHINE)


class Arithmetic(unittest.TestCase):
    def test_the_middle_half_of_few_rounds_is_all_of_them(self):
        self.assertEqual(quartiles([3, 1, 2]), (1, 3))

    def test_the_middle_half_leaves_outliers_out(self):
        low, high = quartiles([1, 2, 3, 4, 5, 6, 1000])
        self.assertEqual((low, high), (2, 6))

    def test_a_ratio_is_that_of_the_medians(self):
        made = Report(lambda _: None)
        made.pairs("p", [(20, 10), (30, 10), (1000, 10)], 2.0, 4.0)
        row = made.rows[0]
        self.assertEqual((row["value"], row["low"], row["high"]), (3.0, 2.0, 100.0))

    def test_the_best_rounds_of_both_sides_are_told(self):
        made = Report(lambda _: None)
        made.pairs("p", [(4000000, 1000000), (2000000, 2000000)], 2.0, 4.0)
        self.assertEqual(made.rows[0]["detail"], "3.000 ms against 1.500 ms, at best 2.00")

    def test_growth_compares_neighbouring_sizes(self):
        made = Report(lambda _: None)
        made.growth("g", [(10, [1, 2, 3]), (100, [20, 24, 30]), (1000, [240, 240, 240])], 10.5)
        self.assertEqual([(row["name"], row["value"]) for row in made.rows], [("g: 10 to 100", 12.0), ("g: 100 to 1000", 10.0)])
        self.assertEqual((made.rows[0]["low"], made.rows[0]["high"]), (10.0, 15.0))
        self.assertTrue(made.is_over)

    def test_growth_tells_what_the_floor_did(self):
        made = Report(lambda _: None)
        made.growth("g", {10: [4], 100: [40]}.items(), 10.5, {10: [2, 3, 4], 100: [36, 36, 36]})
        self.assertEqual(made.rows[0]["detail"], "10 times as many; the floor grew 12.00 times")

    def test_growth_may_be_a_tenth_more_than_the_floors(self):
        made = Report(lambda _: None)
        made.growth("g", {10: [1], 100: [13]}.items(), 10.5, {10: [1], 100: [12]})
        self.assertEqual((made.rows[0]["goal"], made.rows[0]["limit"]), (10.5, 13.2))
        self.assertEqual(verdict(made.rows[0]), "past the goal")
        made.growth("g", {10: [1], 100: [13.3]}.items(), 10.5, {10: [1], 100: [12]})
        self.assertTrue(made.is_over)

    def test_a_median_at_its_bounds_is_within_them(self):
        for value, expected in ((2.0, "within the goal"), (2.01, "past the goal"), (3.0, "past the goal"), (3.01, "PAST THE LIMIT")):
            made = report(("r", value))
            self.assertEqual(verdict(made.rows[0]), expected)
            self.assertEqual(made.is_over, expected == "PAST THE LIMIT")

    def test_what_has_no_goal_passes_no_limit(self):
        made = Report(lambda _: None)
        made.amounts("a", [10**9], "KiB", None, None, "")
        self.assertEqual(verdict(made.rows[0]), "no goal")
        self.assertFalse(made.is_over)

    def test_figures_are_written_with_as_much_as_they_say(self):
        self.assertEqual([written(value) for value in (0.126, 12.34, 123.45, 1234.5)], ["0.13", "12.34", "123.5", "1,234"])
        self.assertEqual(written(8.2, "KiB"), "8.20 KiB")

    def test_a_row_is_printed_as_it_comes(self):
        printed = []
        report(("name", 1.5), out=printed.append)
        self.assertEqual(printed, ["name" + " " * 40 + "       1.50  (1.50 to 1.50)  goal 2.0   limit 3.0   within the goal  "])


class Turns(unittest.TestCase):
    def test_sizes_are_measured_in_turns(self):
        options = types.SimpleNamespace(rounds=None, sizes=[10, 100])
        asked = []

        def measure(size, rounds):
            asked.append((size, rounds))
            return [size] * rounds

        taken = suite.Suite(None, options).in_turns(lambda size: 10 if size == 10 else 2, measure)
        self.assertEqual(taken, {10: [10] * 10, 100: [100] * 2})
        self.assertEqual(asked, [(10, 3), (100, 1), (10, 3), (100, 1), (10, 3), (10, 1)])


class KeptFigures(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.document = document.Document(folder.name)
        self.document.page.write_text("Head\n\n<!-- begin figures -->\nold\n<!-- end figures -->\n\nFoot\n", encoding="utf-8")

    def test_a_whole_run_replaces_all(self):
        self.document.write(fresh(report(("a", 1.0), ("gone", 1.0))), is_whole=True)
        self.document.write(fresh(report(("a", 1.5)), LATER), is_whole=True)
        self.assertEqual([row["name"] for row in self.document.kept()["rows"]], ["a"])
        page = self.document.page.read_text(encoding="utf-8")
        self.assertTrue(page.startswith("Head\n\n<!-- begin figures -->\n"))
        self.assertTrue(page.endswith("<!-- end figures -->\n\nFoot\n"))
        self.assertIn("| `a` | 1.50 | 1.50 to 1.50 | 2 | 3 | within the goal |  |", page)
        self.assertNotIn("gone", page)
        self.assertNotIn("old", page)

    def test_a_part_takes_the_place_of_the_same_names_and_tells_when(self):
        self.document.write(fresh(report(("a", 1.0), ("b", 1.0), ("c", 1.0))), is_whole=True)
        self.document.write(fresh(report(("b", 2.5), ("d", 1.0)), LATER), is_whole=False)
        rows = self.document.kept()["rows"]
        self.assertEqual([(row["name"], row["value"], row["revision"]) for row in rows],
                         [("a", 1.0, "aaaa"), ("b", 2.5, "bbbb"), ("c", 1.0, "aaaa"), ("d", 1.0, "bbbb")])
        page = self.document.page.read_text(encoding="utf-8")
        self.assertIn("Revision bbbb, 2026-01-03 03:04 UTC; load of the machine before it began: 0.2.", page)
        self.assertIn("Measured at another time: `a` at revision aaaa, 2026-01-02 03:04 UTC; `c` at revision aaaa", page)

    def test_a_part_leaves_other_lines_of_the_plot(self):
        first, second = report(("a", 1.0)), report(("b", 1.0))
        first.point("containers", "query", 1000, [1e6, 2e6, 9e6])
        first.point("volumes", "ours", 10, [1e6])
        second.point("containers", "HTTPS", 1000, [4e6])
        self.document.write(fresh(first), is_whole=True)
        series = self.document.write(fresh(second), is_whole=False)["series"]
        self.assertEqual(series, {"containers": {"query": [[1000, 2.0]], "HTTPS": [[1000, 4.0]]}, "volumes": {"ours": [[10, 1.0]]}})

    def test_a_part_of_another_machine_is_refused_and_changes_nothing(self):
        self.document.write(fresh(report(("a", 1.0))), is_whole=True)
        before = self.document.page.read_bytes(), self.document.data.read_bytes()
        with self.assertRaisesRegex(document.Refused, "measured on another machine"):
            self.document.write(fresh(report(("a", 2.0)), machine={**MACHINE, "cores": 64}), is_whole=False)
        self.assertEqual((self.document.page.read_bytes(), self.document.data.read_bytes()), before)

    def test_a_part_alone_is_no_document(self):
        with self.assertRaisesRegex(document.Refused, "no figures yet"):
            self.document.write(fresh(report(("a", 1.0))), is_whole=False)
        self.assertFalse(self.document.data.exists())

    def test_a_page_without_its_marks_is_left_alone(self):
        for text in ("no marks\n", "<!-- end figures -->\n<!-- begin figures -->\n", "<!-- begin figures -->\n" * 2):
            self.document.page.write_text(text, encoding="utf-8")
            with self.assertRaisesRegex(document.Refused, "marks of the part 'figures'"):
                self.document.write(fresh(report(("a", 1.0))), is_whole=True)
            self.assertEqual(self.document.page.read_text(encoding="utf-8"), text)
            self.assertFalse(self.document.data.exists())

    def test_a_busy_machine_is_told(self):
        self.document.write(fresh(report(("a", 1.0)), {**MOMENT, "load": 7.5}), is_whole=True)
        self.assertIn("**The machine had other work", self.document.page.read_text(encoding="utf-8"))

    def test_the_real_page_has_its_marks(self):
        page = (TOP / "docs/benchmarks.md").read_text(encoding="utf-8")
        for part in ("figures", "profile"):
            self.assertIn("\n\nnew\n\n", document.replaced(page, part, ["new"]))

    def test_the_real_page_shows_what_is_kept(self):
        real = document.Document(TOP / "docs")
        page = real.page.read_text(encoding="utf-8")
        self.assertEqual(document.replaced(page, "figures", document.figures(real.kept())), page)


class Plot(unittest.TestCase):
    def test_points_are_drawn_in_the_order_of_sizes(self):
        text = plot.script({"volumes": {"ours": [[100, 2.5], [10, 1.0]]}}, "x.svg")
        self.assertIn("$points0 << end\n10 1.0\n100 2.5\nend\n", text)
        self.assertIn("plot $points0 using 1:2 with linespoints lw 2 dt 1 pt 7 ps 0.6 title 'ours'", text)
        self.assertEqual(text.count("set multiplot next"), 2)


class Usage(unittest.TestCase):
    def refused(self, *words):
        done = subprocess.run([TOP / "tools/bench", *words], text=True, stdout=subprocess.PIPE, stderr=subprocess.PIPE)
        self.assertEqual(done.returncode, 2)
        return done.stderr

    def test_unusual_figures_are_not_written(self):
        for words in (["--rounds", "1"], ["--sizes", "10"], ["--build", "."]):
            self.assertIn("--write goes with the usual rounds, sizes and build", self.refused("--write", *words))

    def test_sizes_are_numbers(self):
        self.assertIn("not 'many'", self.refused("--sizes", "many"))


class Profile(unittest.TestCase):
    def test_samples_count_for_what_the_process_became(self):
        text = ("bench_pair  7  50000\n\tff execve ([kernel.kallsyms])\n\tff __x64_sys_execve ([kernel.kallsyms])\n\n"
                "tovicli  7  50000\n\tff fault ([kernel.kallsyms])\n\tff exc_page_fault ([kernel.kallsyms])\n\n"
                "tovicli  7  40000\n\t7f do_lookup_x (/usr/lib/ld-linux-x86-64.so.2)\n\n"
                "tovicli  7  10000\n\tff odd ([kernel.kallsyms])\n\n"
                "other  8  50000\n\t7f main (/bin/other)\n\n")
        self.assertEqual(profile.time_by_work(text, "tovicli"),
                         {"kernel: start of the program": 50000, "kernel: page faults": 50000, "program: ld.so": 40000,
                          "kernel: the rest": 10000})

    def test_page_faults_are_counted_by_whose_page_it_is(self):
        text = ("    56053a1a5400 __TMC_END__ (/opt/bin/tovicli) ffffffff8175336a elf_load ([kernel.kallsyms])\n"
                "    7f063ec9a120 guard for f()::x (/lib/libplexa.so.1.0.0)     7f063ecc6920 memset (/usr/lib/ld-linux-x86-64.so.2)\n"
                "    7ffca5f6ca09 [unknown] ([stack]) ffffffff81b73c18 _copy_to_user ([kernel.kallsyms])\n"
                "    7f063ec9b008 [unknown] (//anon)     7f063ecab23e _dl_init_paths (/usr/lib/ld-linux-x86-64.so.2)\n")
        self.assertEqual(profile.faults_by_place(text),
                         {"tovicli": 1, "libplexa.so": 1, "stack": 1, "heap and other memory": 1})

    def test_instructions_count_where_they_were_spent(self):
        text = ("ob=(1) /lib/libc.so.6\nfn=(1) puts\n10 5\n+2 7\ncob=(2) /lib/ld-linux-x86-64.so.2\ncfn=(2) x\ncalls=1 3\n* 1000\n"
                "ob=(2)\nfn=(2)\n3 1000\n" "ob=(3) /lib/vgpreload_core.so\nfn=(3)\n1 9\n")
        self.assertEqual(profile.instructions_by_library(text), {"libc.so": 12, "ld.so": 1000})

    def test_mapped_bytes_are_those_of_files(self):
        calls, mapped = profile.system_calls('12 mmap(NULL, 4096, PROT_READ, MAP_PRIVATE, 3, 0) = 0x7f0000\n'
                                             '12 mmap(NULL, 8192, PROT_READ, MAP_PRIVATE|MAP_ANONYMOUS, -1, 0) = 0x7f0000\n'
                                             '12 exit_group(0) = ?\n')
        self.assertEqual((calls, mapped), ({"mmap": 2, "exit_group": 1}, 4096))

    def test_the_linker_s_last_counts_stand(self):
        text = ("\t1:\t            number of relocations: 18\n\t1:\t  number of relocations from cache: 7\n"
                "\t1:\t   number of relative relocations: 13\n\t1:\t      final number of relocations: 20\n")
        self.assertEqual(profile.linker_statistics(text), {"relocations with a symbol": 20, "relocations without one": 13})


if __name__ == "__main__":
    unittest.main()
