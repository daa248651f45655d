#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The daemon and the array's maker, killed at every call and refused every call.

The daemon writes the array file for its clients. When it dies in the middle, the client says so, the next daemon starts,
the volume is there or not, and the same request works. When a write is refused, the client gets one line and the daemon
goes on. With TOVI_LONG it is done for every request that writes, and for the making of a volume at the calls too that
change nothing; without, for the making of a volume.
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


MOUNT = ["configlumo", "mount", *VOLUME]
UMOUNT = ["configlumo", "umount", *VOLUME]
UNBIND = ["daemon", "set", "--unbind-now"]


class Request:
    """What has the daemon write, on a prepared host: commands one after another, until one fails. Which commands finish it
    afterwards, when it was cut off; by default the same. They may find that something was done already."""

    def __init__(self, prepare, *commands, finish=None):
        self.prepare, self.commands, self.finish = prepare, commands, finish or commands

    def run(self, host):
        """@return how the last command ended that was run"""
        for words in self.commands:
            ended = host.lumo(*words)
            if ended.status != 0:
                break
        return ended


REQUESTS = {
    "create": Request(containers, ["configlumo", "add", *VOLUME]),
    "bind": Request(volume, MOUNT),
    # A daemon that starts knows of no volume that waits for its unbinding; mounting lets it wait again.
    "unbind": Request(mounted, UMOUNT, UNBIND, finish=(MOUNT, UMOUNT, UNBIND)),
    "delete": Request(mounted, ["configlumo", "remove", *VOLUME]),
}


def on_array(state):
    """What of a state the daemon writes; the rest the tool does."""
    return {name: state[name] for name in ("volumes", "bound")}


@unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
class DaemonSweep(unittest.TestCase):
    @staticmethod
    def state(host):
        return {**host.state(), "bound": host.rows(host.array, "SELECT directory_name FROM volume "
                                                               "WHERE bound_to IS NOT NULL ORDER BY 1")}

    def rehearse(self, host, request):
        """@return the states that the host may be found in, first and last those before and after the request, and the
        daemon's calls, its start among them"""
        self.assertTrue(host.start())
        request.prepare(host)
        self.assertEqual(host.stop(), 0)
        host.save()
        before = self.state(host)
        log = host.directory / "trace"
        self.assertTrue(host.start(*sweep.tracing(log)))
        # What of it the host does by itself comes before what its daemon does; the answer may be lost of either.
        between = []
        for words in request.commands:
            host.done(*words)
            between.append(self.state(host))
        self.assertEqual(host.stop(), 0)
        after = between.pop()
        self.assertNotEqual(on_array(before), on_array(after))
        host.restore()
        between += [{**before, "bound": after["bound"]}, {**before, **on_array(after)}]
        return [before, *between, after], sweep.calls_of(log, [str(host.root), "<UNIX"])

    def check_afterwards(self, host, request, states, where):
        """A fresh daemon serves what the last one left, and the request works now. @return what was left on the array"""
        self.assertTrue(host.start(), where)
        for path in (host.root / "host.db", host.array):
            self.assertTrue(host.sound(path), f"{where}: {path}")
        state = self.state(host)
        self.assertIn(state, states, where)
        endings = [host.lumo(*words) for words in request.finish]
        if endings[-1].status != 0:
            self.assertEqual(state["volumes"], states[-1]["volumes"], f"{where}: {endings[-1]}")
        self.assertEqual(self.state(host), states[-1], f"{where}: {'; '.join(map(str, endings))}")
        # The next change takes away an array's journal that was made and not yet filled.
        host.done("configlumo", "add", "-n", "another", "-c", GOLD)
        self.assertEqual(host.strangers(), [], where)
        self.assertEqual(host.stop(), 0, where)
        return on_array(state)

    def kill_everywhere(self, name, at_all=False):
        request = REQUESTS[name]
        with Host() as host:
            states, calls = self.rehearse(host, request)
            tried = 0
            seen = []  # on the array, after each death
            for call in calls:
                if not at_all and not sweep.changes(call):
                    continue
                tried += 1
                where = f"{name}, lumod killed at {call.name} number {call.number}: {call.text}"
                if host.start(*sweep.injecting(call, "signal=KILL")):
                    ended = request.run(host)
                    if ended.status != 0:
                        self.assertTrue(host.has_died(), f"{where}: it lives, and yet: {ended}")
                        self.assertEqual(ended.status, 3, f"{where}: {ended}")
                        self.assertRegex(ended.err, r"\Atovicli: [^\n]+\n\Z", where)
                    else:
                        self.assertEqual(self.state(host), states[-1], f"acknowledged, not done; {where}: {ended}")
                    status = host.stop()  # which may be when the call comes
                else:
                    status = host.status
                self.assertIn(status, (-9, 0), where)
                left = self.check_afterwards(host, request, states, where)
                if status == -9:
                    seen.append(left)
                host.restore()
            # Some calls come only as often as the loop happens to turn.
            self.assertGreater(len(seen), max(20, tried * 3 // 4), f"of {tried} kills so many happened")
            self.assertIn(on_array(states[0]), seen)
            self.assertIn(on_array(states[-1]), seen, "no kill came after the change; the sweep proves nothing")
            changed = sum(left == on_array(states[-1]) for left in seen)
            print(f"{name}: lumod killed at {len(seen)} of {tried} calls, {changed} times after the change")

    def fail_everywhere(self, name):
        request = REQUESTS[name]
        with Host() as host:
            states, calls = self.rehearse(host, request)
            told = 0
            for call in calls:
                if str(host.array) not in call.text:
                    continue
                for error in sweep.errors_for(call, asking=False):
                    where = f"{name}, {error} from lumod's {call.name} number {call.number}: {call.text}"
                    self.assertTrue(host.start(*sweep.injecting(call, f"error={error}")), where)
                    ended = request.run(host)
                    if ended.status == 0:
                        self.assertEqual(self.state(host), states[-1], f"acknowledged, not done; {where}: {ended}")
                    else:
                        told += 1
                        self.assertIn(ended.status, (1, 3), f"{where}: {ended}")
                        self.assertRegex(ended.err, r"\Atovicli: [^\n]+small\.array[^\n]+\n\Z", where)
                    self.assertEqual(host.lumo("storagecontainer", "load").status, 0, where)
                    self.assertEqual(host.stop(), 0, where)
                    self.check_afterwards(host, request, states, where)
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
        self.kill_everywhere("create", at_all=LONG)

    def test_fault_47_refused_while_it_creates(self):
        self.fail_everywhere("create")

    @suite.left_unless(LONG, "takes long")
    def test_fault_27_killed_while_it_binds(self):
        self.kill_everywhere("bind")

    @suite.left_unless(LONG, "takes long")
    def test_fault_27_killed_while_it_unbinds(self):
        self.kill_everywhere("unbind")

    @suite.left_unless(LONG, "takes long")
    def test_fault_27_killed_while_it_deletes(self):
        self.kill_everywhere("delete")

    @suite.left_unless(LONG, "takes long")
    def test_fault_47_refused_while_it_binds(self):
        self.fail_everywhere("bind")

    @suite.left_unless(LONG, "takes long")
    def test_fault_47_refused_while_it_unbinds(self):
        self.fail_everywhere("unbind")

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
