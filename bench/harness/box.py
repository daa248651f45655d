# SPDX-License-Identifier: Apache-2.0
"""Programs of a build, and hosts in a box that they run on."""
import json
import os
import pathlib
import shutil
import subprocess
import tempfile
import time

TOP = pathlib.Path(__file__).resolve().parent.parent.parent
SUBTREE = ["storage", "internal", "lumo"]


class Build:
    def __init__(self, directory):
        self.directory = pathlib.Path(directory).resolve()

    def program(self, name):
        return str(self.directory / "bin" / name)


def bring_up_to_date():
    """The build of the bench preset, made or brought up to date."""
    subprocess.run([TOP / "tools/install-packages", "bench"], check=True)
    subprocess.run(["cmake", "--preset", "bench"], cwd=TOP, check=True, stdout=subprocess.DEVNULL)
    subprocess.run(["cmake", "--build", "--preset", "bench", "-j", str(os.cpu_count())], cwd=TOP, check=True,
                   stdout=subprocess.DEVNULL)
    return Build(TOP / "build" / "bench")


class Host:
    """A host in a box on a temporary root; stopped and removed at the end of its `with`."""

    def __init__(self, build, base, topology=None, https=False):
        self.build, self.base, self.topology, self.https = build, base, topology, https

    def __enter__(self):
        self.root = tempfile.mkdtemp(prefix="tovi-bench.", dir=self.base)
        command = [TOP / "lab/up", "--root", self.root, "--build", self.build.directory]
        command += ["--topology", self.topology, "--name", "bench"] if self.topology else []
        command += ["--https"] if self.https else []
        settings = subprocess.run(command, check=True, text=True, stdout=subprocess.PIPE, stderr=subprocess.PIPE).stdout
        told = dict(line.removeprefix("export ").split("=", 1) for line in settings.splitlines())
        self.url, self.array = told["LUMO_ARRAY_URL"], told["LUMO_ARRAY_FILE"]
        self.env = {**os.environ, "TOVI_ROOT": self.root, "PATH": f"{self.build.directory / 'bin'}:{os.environ['PATH']}"}
        return self

    def __exit__(self, *_):
        subprocess.run([TOP / "lab/down", "--root", self.root], check=True, stderr=subprocess.DEVNULL)
        shutil.rmtree(self.root)

    def lumo(self, *words, options=()):
        return subprocess.run(["tovicli", *options, *SUBTREE, *words], env=self.env, check=True, stdin=subprocess.DEVNULL,
                              stdout=subprocess.PIPE).stdout

    def lumo_json(self, *words):
        return json.loads(self.lumo(*words, options=("--format", "json")))

    def register(self, url=None, name="bench"):
        self.lumo("orkaprovider", "add", "--vp-name", name, "--vp-url", url or self.url)

    def record(self, path, *words):
        """Writes down in a file, for floors to send, what is asked of this host's daemon."""
        subprocess.run([self.build.program("bench_record"), path, *words], env=self.env, check=True)

    def trust(self, url, certificate):
        """The host takes this certificate for the provider at the URL."""
        authority = url.removeprefix("https://").split("/")[0]
        name, port = authority.rsplit(":", 1)
        os.makedirs(os.path.join(self.root, "certs"), exist_ok=True)
        shutil.copy(certificate, os.path.join(self.root, "certs", f"{name}_{port}.pem"))


class ArrayServer:
    """An array behind orkasim, with whatever misbehaviour; stopped at the end of its `with`."""

    def __init__(self, build, directory, topology, *options):
        self.build, self.directory, self.topology, self.options = build, pathlib.Path(directory), topology, options

    def __enter__(self):
        self.directory.mkdir()
        self.certificate, self.key = str(self.directory / "cert.pem"), str(self.directory / "key.pem")
        array, ready = self.directory / "served.array", self.directory / "url"
        subprocess.run([self.build.program("orkasim"), "make", self.topology, array], check=True, stdout=subprocess.DEVNULL)
        self.process = subprocess.Popen([self.build.program("orkasim"), "serve", "--cert", self.certificate, "--key", self.key,
                                         "--ready-file", ready, *self.options, array], stdout=subprocess.DEVNULL)
        for _ in range(1000):
            if ready.exists() and ready.read_text().endswith("\n"):
                self.url = ready.read_text().strip()
                return self
            if self.process.poll() is not None:
                break
            time.sleep(0.01)
        self.__exit__()
        raise RuntimeError("orkasim did not start")

    @property
    def authority(self):
        return self.url.removeprefix("https://").split("/")[0]

    def __exit__(self, *_):
        self.process.terminate()
        self.process.wait()
        shutil.rmtree(self.directory)


def rounds_of(command, env):
    """The numbers that a measuring program prints, one line a round."""
    text = subprocess.run(command, env=env, check=True, text=True, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE).stdout
    return [tuple(map(int, line.split())) for line in text.splitlines()]


def timed(command, env):
    """Nanoseconds of one run, start to exit; a failure is no measurement."""
    nowhere = [(os.POSIX_SPAWN_OPEN, fd, "/dev/null", os.O_RDWR, 0) for fd in (0, 1, 2)]
    path = shutil.which(command[0], path=env["PATH"])
    start = time.monotonic_ns()
    _, status = os.waitpid(os.posix_spawn(path, command, env, file_actions=nowhere), 0)
    taken = time.monotonic_ns() - start
    if status != 0:
        raise RuntimeError(f"{' '.join(command)} failed with wait status {status}")
    return taken


def durable_copy(source, path):
    """A copy whose bytes are on the disk already, so that no later sync pays for them."""
    shutil.copy(source, path + ".new")
    with open(path + ".new", "rb") as file:
        os.fsync(file.fileno())
    os.replace(path + ".new", path)
    return path
