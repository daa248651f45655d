#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The daemon and the array's maker, killed at every call and refused every call.

The daemon writes the array file for its clients. When it dies in the middle, the client says so, the next daemon starts,
the volume is there or not, and the same request works. When a write is refused, the client gets one line and the daemon
goes on. With TOVI_LONG it is done for every request that writes; without, for the making of a volume.
"""

import os
import unittest

import sweep
from host import GOLD, TOP, Host, programs
import suite

LONG = bool(os.environ.get("TOVI_LONG"))
VOLUME = ("-n", "vm", "-c", GOLD)


def containers(host):
    host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
    host.done("storagecontainer", "load")


def volume(host):
    containers(host)
    host.done("configlumo", "add", *VOLUME)


def mounted(host):
    volume(host)
    host.done("configlumo", "mount", *VOLUME)


REQUESTS = {
    "create": (containers, ["configlumo", "add", *VOLUME]),
    "bind": (volume, ["configlumo", "mount", *VOLUME]),
    "delete": (mounted, ["configlumo", "remove", *VOLUME]),
}
CHANGING = sweep.WRITING | {"sendto", "sendmsg", "writev"}


@unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
class DaemonSweep(unittest.TestCase):
    def rehearse(self, host, name):
        """@return the request's words, the states before and after, and the daemon's calls, its start among them"""
        prepare, words = REQUESTS[name]
        self.assertTrue(host.start())
        prepare(host)
        self.assertEqual(host.stop(), 0)
        host.save()
        before = host.state()
        log = host.directory / "trace"
        self.assertTrue(host.start(*sweep.tracing(log)))
        host.done(*words)
        self.assertEqual(host.stop(), 0)
        after = host.state()
        self.assertNotEqual(before, after)
        host.restore()
        return words, before, after, sweep.calls_of(log, [str(host.root), "<UNIX"])

    def check_afterwards(self, host, words, before, after, where):
        """A fresh daemon serves what the last one left, and the request works now."""
        self.assertTrue(host.start(), where)
        for path in (host.root / "host.db", host.array):
            self.assertTrue(host.sound(path), f"{where}: {path}")
        state = host.state()
        between = {**before, "volumes": after["volumes"]}  # the array has done it, the answer got lost
        self.assertIn(state, [before, after, between], where)
        again = host.lumo(*words)
        if again.status != 0:
            self.assertEqual(state["volumes"], after["volumes"], f"{where}: {again}")
        self.assertEqual(host.state(), after, f"{where}: {again}")
        # The next change takes away an array's journal that was made and not yet filled.
        host.done("configlumo", "add", "-n", "another", "-c", GOLD)
        self.assertEqual(host.strangers(), [], where)
        self.assertEqual(host.stop(), 0, where)
        return state

    def kill_everywhere(self, name):
        with Host() as host:
            words, before, after, calls = self.rehearse(host, name)
            killed = 0
            for call in calls:
                if call.name not in CHANGING:
                    continue
                where = f"{name}, lumod killed at {call.name} number {call.number}: {call.text}"
                if host.start(*sweep.injecting(call, "signal=KILL")):
                    ended = host.lumo(*words)
                    host.has_died(patience=0.2 if ended.status == 0 else 10)
                    if ended.status != 0:
                        self.assertEqual(ended.status, 3, f"{where}: {ended}")
                        self.assertRegex(ended.err, r"\Atovicli: [^\n]+\n\Z", where)
                    else:
                        self.assertEqual(host.state(), after, f"acknowledged, not done; {where}: {ended}")
                host.stop()  # where the call is one of its end, or this time was none of its calls
                killed += 1
                self.check_afterwards(host, words, before, after, where)
                host.restore()
            self.assertGreater(killed, 20)
            print(f"{name}: lumod killed at {killed} calls")

    def fail_everywhere(self, name):
        with Host() as host:
            words, before, after, calls = self.rehearse(host, name)
            told = 0
            for call in calls:
                if call.name not in sweep.WRITING or str(host.array) not in call.text:
                    continue
                for error in ("EIO", "ENOSPC"):
                    where = f"{name}, {error} from lumod's {call.name} number {call.number}: {call.text}"
                    self.assertTrue(host.start(*sweep.injecting(call, f"error={error}")), where)
                    ended = host.lumo(*words)
                    if ended.status == 0:
                        self.assertEqual(host.state(), after, f"acknowledged, not done; {where}: {ended}")
                    else:
                        told += 1
                        self.assertIn(ended.status, (1, 3), f"{where}: {ended}")
                        self.assertRegex(ended.err, r"\Atovicli: [^\n]+small\.array[^\n]+\n\Z", where)
                    self.assertEqual(host.lumo("storagecontainer", "load").status, 0, where)
                    self.assertEqual(host.stop(), 0, where)
                    self.check_afterwards(host, words, before, after, where)
                    host.restore()
            self.assertGreater(told, 10)
            print(f"{name}: {told} failures told")

    def test_fault_47_refused_while_it_starts(self):
        """It does not start, and says why in a line; or it can do without. Either way the next start works."""
        with Host() as host:
            log = host.directory / "trace"
            self.assertTrue(host.start(*sweep.tracing(log)))
            self.assertEqual(host.stop(), 0)
            told = 0
            for call in sweep.calls_of(log, [str(host.root), "<UNIX"]):
                if call.name not in sweep.WRITING | sweep.ASKING | {"socket", "bind", "listen", "chmod"}:
                    continue
                where = f"EIO from lumod's {call.name} number {call.number}: {call.text}"
                if host.start(*sweep.injecting(call, "error=EIO")):
                    self.assertEqual(host.stop(), 0, where)
                else:
                    told += 1
                    self.assertEqual(host.status, 1, where)
                    self.assertRegex(host.daemon_said(), r"\Alumod: [^\n]+\n\Z", where)
                self.assertTrue(host.start(), where)
                self.assertEqual(host.stop(), 0, where)
                self.assertEqual(host.strangers(), [], where)
            self.assertGreater(told, 5)

    def test_fault_27_killed_while_it_creates(self):
        self.kill_everywhere("create")

    def test_fault_47_refused_while_it_creates(self):
        self.fail_everywhere("create")

    @suite.left_unless(LONG, "takes long")
    def test_fault_27_killed_while_it_binds(self):
        self.kill_everywhere("bind")

    @suite.left_unless(LONG, "takes long")
    def test_fault_27_killed_while_it_deletes(self):
        self.kill_everywhere("delete")

    @suite.left_unless(LONG, "takes long")
    def test_fault_47_refused_while_it_binds(self):
        self.fail_everywhere("bind")

    @suite.left_unless(LONG, "takes long")
    def test_fault_47_refused_while_it_deletes(self):
        self.fail_everywhere("delete")


@unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
class MakerSweep(unittest.TestCase):
    """Kills stand in the array model's own tests; here every write is refused."""

    def test_fault_46_an_array_file_is_made_whole_or_not_at_all(self):
        words = [programs() / "orkasim", "make", TOP / "lab/topologies/small.json"]
        with Host() as host:
            target = host.directory / "made" / "new.array"
            target.parent.mkdir()
            log = host.directory / "trace"
            self.assertEqual(host.run(*sweep.tracing(log), *words, target).status, 0)
            calls = sweep.calls_of(log, [str(target)])
            whole = target.read_bytes()
            told = 0
            for call in calls:
                if call.name not in sweep.WRITING or (not LONG and call.number % 5):
                    continue
                for error in ("EIO", "ENOSPC"):
                    target.unlink(missing_ok=True)
                    where = f"{error} from {call.name} number {call.number}: {call.text}"
                    ended = host.run(*sweep.injecting(call, f"error={error}"), *words, target)
                    if ended.status != 0:
                        told += 1
                        self.assertEqual(ended.status, 1, f"{where}: {ended}")
                        self.assertRegex(ended.err, r"\Aorkasim: [^\n]+\n\Z", where)
                    if target.exists():
                        # Not only when all went well: the name may be there and its directory's sync be refused.
                        self.assertEqual(target.read_bytes(), whole, where)
                    else:
                        self.assertNotEqual(ended.status, 0, where)
                    if call.name in ("unlink", "rmdir"):
                        # It was refused to clean up; the next making does that.
                        self.assertEqual(host.run(*words, target, "--force").status, 0, where)
                    self.assertEqual([p for p in target.parent.iterdir() if p != target], [], where)
            self.assertGreater(told, 5)


if __name__ == "__main__":
    suite.main()
