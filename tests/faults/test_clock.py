#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The wall clock of tool and daemon jumps by ten years, there and back, in the middle of what takes time.

faketime gives both the time that a file says, and leaves the monotonic clock alone. What they wait for comes when it would
have come: not at once, and not ten years later.
"""

import glob
import os
import re
import socket
import subprocess
import threading
import time
import unittest

from host import GOLD, Host, programs
import suite

FAKETIME = glob.glob("/usr/lib/*/faketime/libfaketime.so.1")
JUMPS = ("+3652d", "-3652d")
VOLUME = ("-n", "vm", "-c", GOLD)
PATIENCE = 20  # seconds; far from both wrong answers


class Clock:
    """The wall clock that the host's programs see."""

    def __init__(self, host):
        self.host = host
        self.file = host.directory / "clock"
        self.to("+0")
        host.environment.update(LD_PRELOAD=FAKETIME[0], FAKETIME_TIMESTAMP_FILE=str(self.file), FAKETIME_NO_CACHE="1",
                                FAKETIME_DONT_FAKE_MONOTONIC="1", TOVI_TIMEOUT_MS="2000")

    def to(self, offset):
        next_file = self.host.directory / "clock.next"
        next_file.write_text(offset + "\n")
        os.replace(next_file, self.file)

    def year(self):
        """As the host's programs are told it."""
        return int(self.host.run("date", "+%Y").out)


class Silent:
    """A listener that takes connections and what is sent, and never answers. It knows when somebody waits."""

    def __init__(self, listener):
        self.listener = listener
        self.listener.listen()
        self.is_waited_for = threading.Event()
        self.peers = []
        self.thread = threading.Thread(target=self.take)
        self.thread.start()

    def take(self):
        while True:
            try:
                peer, _ = self.listener.accept()
            except OSError:
                return
            self.peers.append(peer)
            if peer.recv(1 << 16):
                self.is_waited_for.set()

    def close(self):
        self.listener.shutdown(socket.SHUT_RDWR)
        self.thread.join()
        for one in (self.listener, *self.peers):
            one.close()


@unittest.skipUnless(FAKETIME, "there is no faketime here")
class Fault34TheClockJumps(unittest.TestCase):
    def ends_at_its_deadline(self, host, clock, silent, jump, cause):
        """The tool, which waits 2 s for somebody silent, does so whatever the clock says."""
        words = [programs() / "tovicli", "storage", "internal", "lumo", "storagecontainer", "load"]
        began = time.monotonic()
        with subprocess.Popen(list(map(str, words)), env=host.environment, stdin=subprocess.DEVNULL,
                              stdout=subprocess.PIPE, stderr=subprocess.PIPE) as tool:
            try:
                self.assertTrue(silent.is_waited_for.wait(PATIENCE))
                self.assertIsNone(tool.poll())
                clock.to(jump)
                _, err = tool.communicate(timeout=PATIENCE)
            finally:
                tool.kill()
        # The daemon is given a little less than the tool has, so that its answer comes in time.
        self.assertGreaterEqual(time.monotonic() - began, 1.5)
        self.assertEqual(tool.returncode, 3, err)
        self.assertRegex(err.decode(), r"\Atovicli: [^\n]*" + cause + r"[^\n]*\n\Z")
        self.assertGreater(abs(clock.year() - time.gmtime().tm_year), 8, "the clock has not jumped")

    def test_the_tool_gives_a_silent_daemon_up_at_its_deadline(self):
        for jump in JUMPS:
            with self.subTest(jump), Host() as host:
                clock = Clock(host)
                (host.root / "run").mkdir()
                listener = socket.socket(socket.AF_UNIX)  # closed by Silent
                listener.bind(str(host.root / "run/lumod.sock"))
                silent = Silent(listener)
                try:
                    self.ends_at_its_deadline(host, clock, silent, jump, "2000 ms")
                finally:
                    silent.close()

    def test_the_daemon_gives_a_silent_provider_up_at_its_deadline(self):
        for jump in JUMPS:
            with self.subTest(jump), Host() as host:
                clock = Clock(host)
                self.assertTrue(host.start())
                silent = Silent(socket.create_server(("127.0.0.1", 0)))
                try:
                    url = f"https://127.0.0.1:{silent.listener.getsockname()[1]}/orka"
                    host.done("orkaprovider", "add", "--vp-name", "silent", "--vp-url", url)
                    self.ends_at_its_deadline(host, clock, silent, jump, "before the deadline")
                finally:
                    silent.close()
                self.assertEqual(host.stop(), 0)
                years = {int(year) for year in re.findall(r"\b(20\d\d)-\d\d-\d\d", self.log_of(host))}
                self.assertGreater(max(years) - min(years), 8, "the daemon has seen no jump")

    def test_the_unbind_timer_runs_its_time(self):
        for jump in JUMPS:
            with self.subTest(jump), Host() as host:
                clock = Clock(host)
                self.serve(host)
                host.done("configlumo", "add", *VOLUME)
                host.done("configlumo", "mount", *VOLUME)
                host.done("daemon", "set", "--unbind-period", "2000000")
                began = time.monotonic()
                host.done("configlumo", "umount", *VOLUME)
                clock.to(jump)
                while self.is_bound(host):
                    self.assertLess(time.monotonic() - began, PATIENCE, "it never comes")
                    host.done("storagecontainer", "load")
                self.assertGreaterEqual(time.monotonic() - began, 2)
                self.assertEqual(host.stop(), 0)

    def test_a_fault_rule_waits_its_time(self):
        with Host() as host:
            clock = Clock(host)
            self.serve(host)
            rule = ("--fault", "STORAGE_FAULT", "--operation", "queryStorageContainer")
            host.done("faultInjection", "enable", "--enabled", "true")
            host.done("faultInjection", "rule", "add", *rule, "--time", "3600000")
            for jump in JUMPS:
                clock.to(jump)
                host.done("storagecontainer", "load")
            # So that it is known to be able to fire.
            host.done("faultInjection", "rule", "set", *rule, "--time", "1")
            ended = host.lumo("storagecontainer", "load")
            self.assertEqual(ended.status, 1, ended)
            self.assertIn("STORAGE_FAULT", ended.err)
            self.assertEqual(host.stop(), 0)

    def serve(self, host):
        self.assertTrue(host.start())
        host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
        host.done("storagecontainer", "load")

    @staticmethod
    def is_bound(host):
        return host.rows(host.array, "SELECT count(*) FROM volume WHERE directory_name = 'vm' "
                                     "AND bound_to IS NOT NULL") == [(1,)]

    @staticmethod
    def log_of(host):
        return (host.root / "log/lumod.log").read_text()


if __name__ == "__main__":
    suite.main()
