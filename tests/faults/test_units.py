#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The units of the service manager: they are well-formed, they confine the daemon, and the daemon can live with that."""

import os
import pathlib
import re
import shutil
import subprocess
import tempfile
import unittest

import sweep
from host import GOLD, TOP, Host, programs
import suite

UNITS = TOP / "apps/lumod/systemd"
ANALYZE = shutil.which("systemd-analyze")


def analyze(*words):
    return subprocess.run([ANALYZE, *map(str, words)], check=False, capture_output=True, text=True)


@unittest.skipUnless(ANALYZE, "there is no systemd-analyze here")
class Units(unittest.TestCase):
    def test_they_are_well_formed(self):
        with tempfile.TemporaryDirectory() as directory:
            for unit in UNITS.glob("lumod.*"):
                text = unit.read_text().replace("/usr/bin/lumod", str(programs() / "lumod"))
                (pathlib.Path(directory) / unit.name).write_text(text)
            checked = analyze("verify", "--man=no", "--recursive-errors=no", *pathlib.Path(directory).iterdir())
            self.assertEqual((checked.returncode, checked.stderr), (0, ""))

    def test_the_service_is_confined(self):
        told = analyze("security", "--offline=true", "--no-pager", UNITS / "lumod.service").stdout
        exposure = float(re.search(r"exposure level for lumod\.service: ([\d.]+)", told).group(1))
        self.assertLess(exposure, 2.0)
        # Each line that a reader of the analysis would ask about is explained.
        explained = (TOP / "docs/security.md").read_text()
        for name in re.findall(r"^✗ (\S+?)=", told, re.MULTILINE):
            self.assertIn(f"`{name}=`", explained, "an exposure that docs/security.md does not explain")

    @unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
    def test_no_call_that_the_daemon_needs_is_filtered(self):
        allowed = self.calls_allowed()
        lines = self.trace(lambda host: host.url) + self.trace(Host.serve)
        used = {match.group(1) for match in map(sweep.CALL.match, lines) if match}
        self.assertLess({"pwrite64", "connect"}, used)
        # The service manager itself calls execve before the filter holds.
        self.assertEqual(sorted(used - allowed - {"execve"}), [])

    @unittest.skipUnless(sweep.can_trace(), "strace cannot trace here")
    def test_its_sockets_are_of_families_that_it_may_have(self):
        families = re.search(r"^RestrictAddressFamilies=(.+)$", self.service(), re.MULTILINE).group(1).split()
        self.assertIn("SocketBindDeny=any", self.service().splitlines())
        # Looking a name up, the C library asks which addresses this host has, and does without an answer: it gets none.
        told = self.trace(Host.serve, "-e", "inject=getsockname:error=EAFNOSUPPORT")
        self.assertIn("INJECTED", "".join(told))
        lines = [line for line in told if "NETLINK" not in line]
        opened = set(re.findall(r"\bsocket\((AF_\w+)", "\n".join(lines)))
        self.assertIn("AF_INET", opened)
        self.assertEqual(sorted(opened - set(families)), [])
        bound = [line for line in lines if re.search(r"\bbind\(", line) and "AF_UNIX" not in line]
        self.assertEqual(bound, [])

    def trace(self, url_of, *options):
        """A daemon's calls while it reaches an array at the URL that a host gives."""
        with Host() as host:
            url = url_of(host)
            log = host.directory / "trace"
            self.assertTrue(host.start("strace", "-f", "-o", log, *options))
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", url)
            host.done("storagecontainer", "load")
            host.done("configlumo", "add", "-n", "vm", "-c", GOLD)
            host.done("configlumo", "mount", "-n", "vm", "-c", GOLD)
            host.done("configlumo", "remove", "-n", "vm", "-c", GOLD)
            self.assertEqual(host.stop(), 0)
            return log.read_text(errors="replace").splitlines()

    @unittest.skipUnless(os.geteuid() == 0 and shutil.which("setpriv"), "only root has capabilities to lose")
    def test_the_daemon_needs_no_capability(self):
        with Host() as host:
            self.assertTrue(host.start("setpriv", "--bounding-set=-all", "--inh-caps=-all", "--no-new-privs"))
            held = (pathlib.Path("/proc") / str(host.daemon_pid()) / "status").read_text()
            self.assertRegex(held, r"CapEff:\s0+\n")
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", host.url)
            host.done("storagecontainer", "load")
            host.done("configlumo", "add", "-n", "vm", "-c", GOLD)
            host.done("configlumo", "mount", "-n", "vm", "-c", GOLD)
            self.assertEqual(host.stop(), 0)

    @staticmethod
    def service():
        return (UNITS / "lumod.service").read_text()

    def calls_allowed(self):
        """As the service's SystemCallFilter= lines add and take away."""
        allowed = set()
        for line in self.service().splitlines():
            if line.startswith("SystemCallFilter="):
                words = line.split("=", 1)[1]
                calls = set().union(*map(self.members, words.lstrip("~").split()))
                allowed = allowed - calls if words.startswith("~") else allowed | calls
        self.assertGreater(len(allowed), 100)
        return allowed

    def members(self, name):
        if not name.startswith("@"):
            return {name}
        told = analyze("syscall-filter", "--no-pager", name).stdout
        words = [line.strip() for line in told.splitlines()[1:] if line.strip() and not line.strip().startswith("#")]
        return set().union(*map(self.members, words))


if __name__ == "__main__":
    suite.main()
