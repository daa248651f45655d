# SPDX-License-Identifier: Apache-2.0
"""Three hosts of one storage array: a root and a lumod each, and one orkasim that all of them reach over HTTPS.

lab/up brings them up in a temporary directory; the first of them has the array's server beside its daemon. Programs
come from TOVI_BUILD_DIR, which ctest sets.
"""

import json
import os
import pathlib
import select
import shutil
import signal
import sqlite3
import subprocess
import sys
import tempfile
import threading

TOP = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.append(str(TOP / "tests"))  # suite.py, for whoever imports this
NAMES = ("a", "b", "c")
CONTAINERS = {"gold": "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001",
              "silver": "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002",
              "archive": "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9003"}
GOLD = CONTAINERS["gold"]
MEMORY = pathlib.Path("/dev/shm")


def build():
    given = os.environ.get("TOVI_BUILD_DIR")
    if not given:
        raise SystemExit("run this through ctest, or set TOVI_BUILD_DIR to a build directory")
    return pathlib.Path(given).resolve()


def kill(pid):
    """Kills a process and waits until it is gone."""
    descriptor = os.pidfd_open(pid)
    try:
        signal.pidfd_send_signal(descriptor, signal.SIGKILL)
        select.select([descriptor], [], [])
    finally:
        os.close(descriptor)


class Ended:
    """How a run of the tool ended."""

    def __init__(self, words, done):
        self.words, self.status, self.out, self.err = words, done.returncode, done.stdout, done.stderr

    def __str__(self):
        return f"{' '.join(self.words)}: status {self.status}\n--- out\n{self.out}--- err\n{self.err}"


class Host:
    """One root. Its daemon may be killed and brought back while others work with it."""

    def __init__(self, name, directory, options):
        self.name, self.options = name, options
        self.root = directory / name
        self.environment = {k: v for k, v in os.environ.items() if not k.startswith("TOVI_")}
        self.environment.update(TOVI_ROOT=str(self.root), TOVI_TIMEOUT_MS="20000")
        self.url = None
        self.kills = 0
        self.disturbances = 0  # beginnings and ends of times in which commands may fail
        self.is_up = threading.Event()

    def up(self):
        told = subprocess.run([TOP / "lab/up", "--root", self.root, "--build", build(), *self.options], check=False,
                              capture_output=True, text=True)
        assert told.returncode == 0, told.stderr
        self.url = next(line for line in told.stdout.splitlines() if "LUMO_ARRAY_URL" in line).split("=", 1)[1]
        self.settle()

    def down(self):
        if (self.root / "run").exists():
            subprocess.run([TOP / "lab/down", "--root", self.root], check=True, capture_output=True)

    def disturb(self):
        self.disturbances += 1
        self.is_up.clear()

    def settle(self):
        self.disturbances += 1
        self.is_up.set()

    def kill_and_return(self):
        """The daemon dies without a word, and is back after a while."""
        self.kills += 1
        self.disturb()
        kill(int((self.root / "run/lumod.pid").read_text()))
        self.up()

    def tool(self, *words):
        words = [str(word) for word in words]
        done = subprocess.run([build() / "bin/tovicli", *words], env=self.environment, stdin=subprocess.DEVNULL,
                              capture_output=True, text=True, check=False, timeout=120)
        return Ended([self.name + ":", *words], done)

    def lumo(self, *words):
        return self.tool("storage", "internal", "lumo", *words)

    def done(self, *words):
        """A command that must succeed."""
        ended = self.lumo(*words)
        assert ended.status == 0, ended
        return ended

    def json(self, *words):
        ended = self.tool("--format", "json", "storage", "internal", "lumo", *words)
        assert ended.status == 0, ended
        return json.loads(ended.out)

    # What the host sees.

    def statuses(self, container):
        """Each config volume of the container, by id, and whether the host can reach it."""
        rows = self.json("storagecontainer", "checklumos", "--path", self.root / "volumes" / container)
        return {row["LumoId"]: row["Status"] for row in rows}

    def sizes(self, container):
        """Each config volume of the container, by id, and its size and committed size in MB."""
        told = {}
        for uuid in self.statuses(container):
            facts = self.json("virtualvolume", "get", "-c", CONTAINERS[container], "-u", uuid)
            told[uuid] = (facts["Logical Size"], facts["Committed Size"])
        return told

    def directories(self):
        """Mounted volumes, and what is put away of unmounted ones."""
        return sorted(str(path.relative_to(self.root)) for path in
                      [*(self.root / "volumes").glob("*/*"), *(self.root / "lumos").glob("*")])

    def strangers(self):
        """Files that have no business in a root at rest."""
        known = {"host.db", "run/lumod.lock", "run/lumod.pid", "run/lumod.sock", "run/lumod-priority.sock",
                 "log/lumod.log", "log/lab.log", "run/lab.daemon", "log/orkasim.log", "run/lab.orkasim",
                 "run/lab.array", "run/orkasim.url", "run/orkasim.pem", "run/orkasim.key", "arrays/small.array"}
        files = {str(path.relative_to(self.root)) for path in self.root.rglob("*") if not path.is_dir()}
        return sorted(name for name in files - known if not name.startswith(("volumes/", "lumos/", "certs/")))

    def store_is_sound(self):
        return query(self.root / "host.db", "PRAGMA integrity_check") == [("ok",)]


def query(path, sql):
    database = sqlite3.connect(path)
    try:
        return database.execute(sql).fetchall()
    finally:
        database.close()


class Fleet:
    """Use it as a context manager: what it made and started is gone at the end."""

    def __init__(self):
        place = MEMORY if os.access(MEMORY, os.W_OK) else None
        self.directory = pathlib.Path(tempfile.mkdtemp(prefix="tovi-fleet-", dir=place))
        first = self.directory / NAMES[0]
        self.hosts = [Host(name, self.directory, ["--https"] if name == NAMES[0] else ["--beside", first])
                      for name in NAMES]
        self.array = first / "arrays/small.array"
        self.server = None  # of the array, once it is not the one that lab/up started

    def __enter__(self):
        try:
            for host in self.hosts:
                host.up()
        except BaseException:
            self.__exit__()
            raise
        return self

    def __exit__(self, *_):
        for host in reversed(self.hosts):
            host.down()
        self.end_server()
        shutil.rmtree(self.directory, ignore_errors=True)

    def end_server(self):
        if self.server is not None:
            self.server.wait(timeout=20)
            self.server.stdout.close()
            self.server = None

    def kill_server_and_return(self):
        """The array's server dies under all hosts, and another one takes its place."""
        run = self.hosts[0].root / "run"
        record = run / "lab.orkasim"
        for host in self.hosts:
            host.disturb()
        kill(int(record.read_text().split()[0]))
        self.end_server()
        place = (run / "orkasim.url").read_text().split("/")[2]
        words = ["serve", "--listen", place, "--cert", run / "orkasim.pem", "--key", run / "orkasim.key", self.array]
        self.server = subprocess.Popen([build() / "bin/orkasim", *words], stdin=subprocess.DEVNULL,
                                       stdout=subprocess.PIPE, text=True)
        assert place in self.server.stdout.readline(), "orkasim did not come back"
        # As lab/up records it: id and start time, behind the name in parentheses.
        started = pathlib.Path(f"/proc/{self.server.pid}/stat").read_text().rpartition(") ")[2].split()[19]
        record.write_text(f"{self.server.pid} {started}\n")
        for host in self.hosts:
            host.settle()

    def join(self, url=None):
        """Every host knows the array, and has its containers. @param url where it is; None: at its server"""
        for host in self.hosts:
            host.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", url or host.url)
            host.done("storagecontainer", "load")

    # What the array itself holds.

    def volumes(self, container):
        """Each config volume by id: size and committed size in MB."""
        return {uuid: (size, committed) for uuid, size, committed in query(
            self.array, "SELECT v.uuid, v.size_mb, v.committed_mb FROM volume v JOIN container c "
                        f"ON c.seq = v.container WHERE c.name = '{container}' AND v.directory_name IS NOT NULL")}

    def names(self, container):
        return {name for name, in query(
            self.array, "SELECT v.directory_name FROM volume v JOIN container c ON c.seq = v.container "
                        f"WHERE c.name = '{container}' AND v.directory_name IS NOT NULL")}

    def bound(self):
        """The names of volumes that are bound, each with its endpoint."""
        return dict(query(self.array, "SELECT v.directory_name, e.uid FROM volume v JOIN endpoint e "
                                      "ON e.seq = v.bound_to"))

    def everything(self):
        """All that the array holds of volumes, for comparing before and after."""
        return [query(self.array, f"SELECT * FROM {table} ORDER BY 1, 2") for table in ("volume", "metadata")]
