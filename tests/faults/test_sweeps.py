#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Commands that change something, killed at every call and refused every call.

However a command ends, what it was to change is done or not done, the next command works, the files are sound, and
nothing is left lying about. With TOVI_LONG each call that touches the root or the daemon has its turn; without it, two
commands and the calls that change something.
"""

import os
import unittest

import sweep
from host import ARCHIVE, GOLD, Host, programs
import suite

LONG = bool(os.environ.get("TOVI_LONG"))
VOLUME = ("-n", "vm", "-c", GOLD)
ENDPOINT = "pe-north-scsi-1"
NOTICE = "Notify PE APD command returned containers: gold"
CONTEXT = ("orkacontext", "set", "-u", "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9")


def registered(host):
    host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)


def mounted_containers(host):
    registered(host)
    host.done("storagecontainer", "load")


def one_container_less(host):
    mounted_containers(host)
    host.done("storagecontainer", "remove", "--container-id", ARCHIVE)


def mounted_volume(host):
    mounted_containers(host)
    host.done("configlumo", "add", *VOLUME)
    host.done("configlumo", "mount", *VOLUME)
    (host.root / "volumes/gold/vm/file").write_text("precious")


def unmounted_volume(host):
    mounted_volume(host)
    host.done("configlumo", "umount", *VOLUME)


def endpoint_out(host):
    mounted_containers(host)
    notified = host.lumo("daemon", "set", "--start-pe-apd", ENDPOINT)
    assert (notified.status, NOTICE in notified.err) == (1, True), notified


class Command:
    """One command on a prepared host, and what its repetition may say once it has been done. One that tells a notice has
    done what it was to do when it tells it, and its status is 1. One whose result is a truth value prints a false one."""

    def __init__(self, prepare, words, done_already="", between=None, notice=None, refused=""):
        self.prepare, self.words, self.done_already, self.between = prepare, words, done_already, between
        self.notice, self.refused = notice, refused

    def has_done(self, ended):
        """Whether a run of it says that it was done."""
        if self.notice is None:
            return ended.status == 0
        return ended.status == 1 and self.notice in ended.err


def array_only(before, after):
    """A removal that was cut off between array and host: the array is done, the host is not; repeating it finishes."""
    return {**before, "volumes": after["volumes"]}


def directory_only(before, after):
    """The record counts. A container whose directory alone is gone is mounted, and gets one when it needs one; a directory
    without a record is nothing yet, and the next mount takes it over."""
    return {**before, "directories": after["directories"]}


COMMANDS = {
    "first provider add": Command(lambda host: None, ["orkaprovider", "add", "--vp-name", "x", "--vp-url", "file:///x"],
                                  "already exists"),
    "provider add": Command(registered, ["orkaprovider", "add", "--vp-name", "x", "--vp-url", "file:///x"],
                            "already exists"),
    "provider set": Command(registered, ["orkaprovider", "set", "--vp-name", "lab", "--arrayid", "array-north",
                                         "--priority", "7", "--isactive", "true"]),
    "provider remove": Command(registered, ["orkaprovider", "remove", "--vp-name", "lab"], "is registered"),
    "context set": Command(registered, CONTEXT, refused="false\n"),
    "context clear": Command(lambda host: host.done(*CONTEXT), ["orkacontext", "set", "--clear"], refused="false\n"),
    "outage begin": Command(mounted_containers, ["daemon", "set", "--start-pe-apd", ENDPOINT], notice=NOTICE),
    "outage end": Command(endpoint_out, ["daemon", "set", "--end-pe-apd", ENDPOINT], notice=NOTICE),
    "container add": Command(one_container_less, ["storagecontainer", "add", "-n", "archive", "-c", ARCHIVE],
                             "mounted already", directory_only),
    "container load": Command(one_container_less, ["storagecontainer", "load"], between=directory_only),
    "container remove": Command(mounted_containers, ["storagecontainer", "remove", "--container-id", ARCHIVE],
                                "is not mounted", directory_only),
    "volume add": Command(mounted_containers, ["configlumo", "add", *VOLUME], "already"),
    "volume mount": Command(unmounted_volume, ["configlumo", "mount", *VOLUME], "is mounted already"),
    "volume umount": Command(mounted_volume, ["configlumo", "umount", *VOLUME], "is mounted in"),
    "volume remove": Command(mounted_volume, ["configlumo", "remove", *VOLUME], "no config volume", array_only),
}


@unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
class Sweep(unittest.TestCase):
    """Base of the two sweeps: what a command is, what it leads to, and what must hold afterwards."""

    def rehearse(self, host, command):
        """Prepares the host and runs the command once. @return the states before and after, and the command's calls"""
        self.assertTrue(host.start())
        command.prepare(host)
        host.save()
        before = host.state()
        log = host.directory / "trace"
        ended = host.run(*sweep.tracing(log), *self.words_of(command))
        self.assertTrue(command.has_done(ended), ended)
        after = host.state()
        self.assertNotEqual(before, after)
        host.restore()
        return before, after, sweep.calls_of(log, [str(host.root), "<UNIX"])

    def words_of(self, command):
        return [programs() / "tovicli", "storage", "internal", "lumo", *command.words]

    def check_afterwards(self, host, command, states, where):
        """Whatever happened, the host is in one of the states, works, and can be brought to the last one."""
        # The daemon changes volumes one after another, so this answer comes after whatever it still had to do ...
        last = host.lumo("configlumo", "mount", "-n", "no such volume", "-c", GOLD)
        self.assertEqual(last.status, 1, f"{where}: {last}")
        # ... and this finishes what was to be moved on the host.
        settled = host.lumo("configlumo", "umount", "-n", "no such volume", "-c", GOLD)
        self.assertEqual(settled.status, 1, f"{where}: {settled}")
        for path in (host.root / "host.db", host.array):
            self.assertTrue(host.sound(path), f"{where}: {path}")
        state = host.state()
        self.assertIn(state, states, where)
        again = host.lumo(*command.words)
        if not command.has_done(again):
            self.assertEqual(state, states[-1], f"{where}: {again}")
            self.assertIn(command.done_already or "nothing", again.err, where)
        self.assertEqual(host.state(), states[-1], f"{where}: {again}")
        # A journal that was made and not yet filled means nothing; the next change takes it away.
        host.done("orkacontext", "set", "-u", "11111111-2222-3333-4444-555555555555")
        self.assertEqual(host.strangers(), [], where)
        return state

    def states_of(self, command, before, after):
        between = [command.between(before, after)] if command.between else []
        return [before, *between, after]


class Kills(Sweep):
    def kill_everywhere(self, name):
        command = COMMANDS[name]
        with Host() as host:
            before, after, calls = self.rehearse(host, command)
            states = self.states_of(command, before, after)
            seen = []
            for call in calls:
                if not LONG and not sweep.changes(call) and call.name not in sweep.ANSWERED:
                    continue
                where = f"{name}, killed at {call.name} number {call.number}: {call.text}"
                ended = host.run(*sweep.injecting(call, "signal=KILL"), *self.words_of(command))
                if command.has_done(ended) and call.name in sweep.WAITING:
                    host.restore()
                    continue  # what was waited for had come already, so that there were fewer calls this time
                self.assertEqual(ended.status, -9, f"{where}: {ended}")
                seen.append(self.check_afterwards(host, command, states, where))
                host.restore()
            self.assertIn(before, seen)
            self.assertIn(after, seen, "no kill came after the change; the sweep proves nothing")
            print(f"{name}: killed at {len(seen)} calls")


class Errors(Sweep):
    def fail_everywhere(self, name):
        command = COMMANDS[name]
        with Host() as host:
            before, after, calls = self.rehearse(host, command)
            states = self.states_of(command, before, after)
            failed = 0
            for call in calls:
                for error in sweep.errors_for(call, asking=LONG):
                    where = f"{name}, {error} from {call.name} number {call.number}: {call.text}"
                    ended = host.run(*sweep.injecting(call, f"error={error}"), *self.words_of(command))
                    state = self.check_afterwards(host, command, states, where)
                    if command.has_done(ended):
                        self.assertEqual(state, after, f"acknowledged, not done; {where}: {ended}")
                    else:
                        self.check_failure(command, ended, state, before, where)
                        failed += 1
                    host.restore()
            self.assertGreater(failed, 0)
            print(f"{name}: {failed} failures told")

    def check_failure(self, command, ended, state, before, where):
        self.assertIn(ended.status, (1, 3), f"{where}: {ended}")
        self.assertIn(ended.out, ("", command.refused), where)
        self.assertRegex(ended.err, r"\Atovicli: [^\n]+\n\Z", where)
        if "nothing was changed" in ended.err:
            self.assertEqual(state, before, f"{where}: {ended}")


def each(names, make):
    """One test method for each command, named after it."""
    def add(to):
        for name in names:
            setattr(to, f"test_{name.replace(' ', '_')}", lambda self, name=name: make(self, name))
        return to
    return add


BRIEF = ["provider add", "volume mount"]


@each(COMMANDS if LONG else BRIEF, Kills.kill_everywhere)
class Fault27KilledAtEveryCall(Kills):
    pass


@each(COMMANDS if LONG else BRIEF, Errors.fail_everywhere)
class Fault47RefusedAtEveryCall(Errors):
    pass


if __name__ == "__main__":
    suite.main()
