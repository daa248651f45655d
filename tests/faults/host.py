# SPDX-License-Identifier: Apache-2.0
"""A host in a box for tests that break things: a root, an array file, a daemon of its own, and the tool.

Every host lives in a temporary directory and ends what it started, by process id. Programs come from TOVI_BUILD_DIR,
which ctest sets.
"""

import os
import pathlib
import re
import shutil
import signal
import sqlite3
import subprocess
import sys
import tempfile

TOP = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.append(str(TOP / "tests"))  # suite.py, for whoever imports this
GOLD = "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001"
ARCHIVE = "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9003"
SETTINGS = ("TOVI_ROOT", "TOVI_OFFLINE", "TOVI_TIMEOUT_MS", "TOVI_REQUEST_ID", "TOVI_LOG_LEVEL")


def programs():
    """The directory of the programs under test."""
    build = os.environ.get("TOVI_BUILD_DIR")
    if not build:
        raise SystemExit("run this through ctest, or set TOVI_BUILD_DIR to a build directory")
    return pathlib.Path(build).resolve() / "bin"


class Ended:
    """How a run ended: its status (negative: the signal), and what it wrote."""

    def __init__(self, words, status, out, err):
        self.words, self.status, self.out, self.err = words, status, out, err

    def __str__(self):
        return f"{' '.join(map(str, self.words))}: status {self.status}\n--- out\n{self.out}--- err\n{self.err}"


class Host:
    """Use it as a context manager: what it made and started is gone at the end."""

    def __init__(self):
        self.directory = pathlib.Path(tempfile.mkdtemp(prefix="tovi-faults-"))
        self.root = self.directory / "root"
        self.array = self.root / "arrays" / "small.array"
        self.url = f"file://{self.array}"
        self.daemon = None
        self.server = None  # of the array, where it is served over HTTPS
        self.status = None  # of a daemon that did not get ready
        self.environment = {k: v for k, v in os.environ.items() if k not in SETTINGS}
        self.environment["TOVI_ROOT"] = str(self.root)
        self.environment["TOVI_TIMEOUT_MS"] = "20000"

    def __enter__(self):
        self.array.parent.mkdir(parents=True)
        made = self.run(programs() / "orkasim", "make", TOP / "lab/topologies/small.json", self.array)
        assert made.status == 0, made
        return self

    def __exit__(self, *_):
        self.stop()
        if self.server is not None:
            self.server.terminate()
            self.server.wait(timeout=20)
            self.server.stdout.close()
        shutil.rmtree(self.directory, ignore_errors=True)

    def run(self, *words, stdin=None, **settings):
        """Runs a program to its end; settings are added to its environment."""
        environment = {**self.environment, **settings}
        done = subprocess.run([str(w) for w in words], env=environment, stdin=stdin or subprocess.DEVNULL,
                              capture_output=True, check=False, timeout=120)
        # Whatever goes in, what comes out is UTF-8.
        return Ended(words, done.returncode, done.stdout.decode(), done.stderr.decode())

    def tool(self, *words, **settings):
        return self.run(programs() / "tovicli", *words, **settings)

    def lumo(self, *words, **settings):
        return self.tool("storage", "internal", "lumo", *words, **settings)

    def done(self, *words):
        """A command that must succeed."""
        ended = self.lumo(*words)
        assert ended.status == 0, ended
        return ended

    def start(self, *tracer):
        """Starts the daemon, perhaps under a tracer. @return whether it got ready"""
        with (self.directory / "daemon.err").open("wb") as err:
            self.daemon = subprocess.Popen([*map(str, tracer), str(programs() / "lumod"), "--root", str(self.root)],
                                           env=self.environment, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                                           stderr=err)
        if self.daemon.stdout.readline().startswith(b"lumod: ready"):
            return True
        self.status = self.buried()
        return False

    def daemon_said(self):
        """What the daemon that was started last has written to standard error."""
        return (self.directory / "daemon.err").read_text(errors="replace")

    def daemon_pid(self):
        return int((self.root / "run/lumod.pid").read_text())

    def stop(self):
        """Ends the daemon, if it runs. @return its status"""
        if self.daemon is None:
            return None
        if self.daemon.poll() is None:
            try:
                os.kill(self.daemon_pid(), signal.SIGTERM)
            except ProcessLookupError:
                pass  # it ended by itself just now
        return self.buried()

    def buried(self):
        """Waits for the daemon's end. @return its status"""
        status = self.daemon.wait(timeout=20)
        self.daemon.stdout.close()
        self.daemon = None
        return status

    def has_died(self, patience=10):
        """Whether the daemon ends within that many seconds by itself."""
        try:
            self.daemon.wait(timeout=patience)
            return True
        except subprocess.TimeoutExpired:
            return False

    def serve(self, *options, name="localhost"):
        """Serves the host's array over HTTPS, under a name that has to be looked up, and lets the host trust it.
        @return the provider's URL"""
        certificate = self.directory / "cert.pem"
        words = ["serve", "--cert", certificate, "--key", self.directory / "key.pem", "--cert-name", name, *options,
                 self.array]
        self.server = subprocess.Popen([str(programs() / "orkasim"), *map(str, words)], stdin=subprocess.DEVNULL,
                                       stdout=subprocess.PIPE)
        port = re.match(rb"https://[^/]*:(\d+)/", self.server.stdout.readline()).group(1).decode()
        (self.root / "certs").mkdir(exist_ok=True)
        shutil.copy(certificate, self.root / "certs" / f"{name}_{port}.pem")
        return f"https://{name}:{port}/orka"

    # What is there, for comparing before and after.

    def rows(self, path, sql):
        database = sqlite3.connect(path)
        try:
            return database.execute(sql).fetchall()
        finally:
            database.close()

    def sound(self, path):
        """Whether a database file passes its integrity check; one that does not exist is sound."""
        return not path.exists() or self.rows(path, "PRAGMA integrity_check") == [("ok",)]

    def state(self):
        """What a user can see of the host and its array. Bindings are left out: a volume that is bound and not mounted
        is mounted or deleted like any other."""
        store = self.root / "host.db"
        stored = {name: [] for name in ("providers", "arrays", "containers", "mounted", "outages", "settings")}
        if store.exists() and store.stat().st_size > 0:
            stored = {
                "providers": self.rows(store, "SELECT name, url, aux_text FROM provider ORDER BY id"),
                "arrays": self.rows(store, "SELECT provider, array_id, is_active, priority FROM provider_array "
                                           "ORDER BY provider, position"),
                "containers": self.rows(store, "SELECT name, container_id FROM file_system ORDER BY name"),
                # Mounted or on the way; the rest of a volume's story is told by the directories.
                "mounted": self.rows(store, "SELECT uuid, directory_name FROM volume WHERE state IN (0, 2) ORDER BY 1"),
                "outages": self.rows(store, "SELECT uid FROM endpoint_outage ORDER BY 1"),
                "settings": self.rows(store, "SELECT name, value FROM setting ORDER BY 1"),
            }
        return {
            **stored,
            "volumes": self.rows(self.array, "SELECT directory_name, size_mb FROM volume ORDER BY 1"),
            "directories": sorted(str(p.relative_to(self.root)) for top in ("volumes", "lumos")
                                  for p in (self.root / top).rglob("*")),
        }

    def strangers(self):
        """Files that have no business in a root at rest."""
        known = {"host.db", "arrays/small.array", "run/lumod.lock", "run/lumod.pid", "run/lumod.sock",
                 "run/lumod-priority.sock", "log/lumod.log"}
        files = {str(p.relative_to(self.root)) for p in self.root.rglob("*") if not p.is_dir()}
        return sorted(f for f in files - known if not f.startswith(("volumes/", "lumos/")))

    # Going back to an earlier state while the daemon runs: it notices files that were replaced.

    def save(self):
        saved = self.directory / "saved"
        shutil.rmtree(saved, ignore_errors=True)
        saved.mkdir()
        for name in ("host.db", "arrays", "volumes", "lumos"):
            source = self.root / name
            if source.is_dir():
                shutil.copytree(source, saved / name)
            elif source.exists():
                shutil.copy2(source, saved / name)

    def restore(self):
        saved = self.directory / "saved"
        for name in ("volumes", "lumos"):
            shutil.rmtree(self.root / name, ignore_errors=True)
            if (saved / name).exists():
                shutil.copytree(saved / name, self.root / name)
        for stray in [*self.root.glob("host.db*"), *self.array.parent.glob("*")]:
            stray.unlink()
        for name in ("host.db", "arrays/small.array"):
            if (saved / name).exists():
                shutil.copy2(saved / name, self.directory / "next")
                os.replace(self.directory / "next", self.root / name)
