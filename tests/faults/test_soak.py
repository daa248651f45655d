#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""One process that calls and calls: a program on liblumo, and the tool's shell. Neither they nor their daemon grow.

With TOVI_LONG each makes a million calls; without, twenty thousand. What the daemon does for raw connections by the
million is in test_crowds.py.
"""

import ctypes
import itertools
import os
import subprocess
import threading
import unittest

from host import GOLD, Host, programs
from test_crowds import MIB, descriptors, resident

CALLS = 1_000_000 if os.environ.get("TOVI_LONG") else 20_000
NOWHERE = "00000000-0000-0000-0000-000000000000"


class Marks:
    """Memory and descriptors of some processes: after a quarter of the calls, when every pool has its size, and later."""

    def __init__(self, **processes):
        self.processes = processes
        self.taken = []

    def take(self):
        self.taken.append({name: (resident(pid), descriptors(pid)) for name, pid in self.processes.items()})

    def hold(self, test, room=MIB):
        test.assertEqual(len(self.taken), 4)
        for name in self.processes:
            told = [mark[name] for mark in self.taken]
            test.assertLess(told[-1][0] - told[0][0], room, f"{name}: {told}")
            # A connection that was closed a moment ago may still be open at its other end.
            test.assertLessEqual(max(count for _, count in told), told[0][1] + 1, f"{name}: {told}")
            test.assertLessEqual(min(count for _, count in told[2:]), told[0][1], f"{name}: {told}")


class LumoErrorEx(ctypes.Structure):
    _fields_ = [("code", ctypes.c_int32), ("text", ctypes.c_char * 252)]


class Library:
    """liblumo in this process. Every method is one or two calls of the daemon and frees what it was given."""

    def __init__(self, box, uuid):
        os.environ.update({name: box.environment[name] for name in ("TOVI_ROOT", "TOVI_TIMEOUT_MS")})
        self.library = ctypes.CDLL(str(programs().parent / "lib/liblumo.so.1"))
        self.library.LumoLib_GetStorageContainer.restype = LumoErrorEx
        self.system = ctypes.CDLL(None)
        self.system.free.restype = None
        self.gold, self.uuid = GOLD.encode(), uuid.encode()
        self.result = ctypes.c_void_p()
        self.out = ctypes.byref(self.result)

    def freed(self, code, free):
        assert (code == 0) == (self.result.value is not None), (code, self.result)
        free(self.result)
        self.result.value = None
        return code

    def reopen(self):
        self.library.LumoLib_Exit()
        return 0 if self.library.LumoLib_Init(0, 0) else -1

    def containers(self):
        error = self.library.LumoLib_GetStorageContainer(0, None, self.out)
        return self.freed(error.code, self.library.LumoLib_FreeStorageContainerResult)

    def volumes(self):
        code = self.library.LumoLib_QueryAllConfigLumos(self.gold, 100, 0, self.out, 0)
        return self.freed(code, self.library.LumoLib_FreeQueryResult)

    def information(self):
        code = self.library.LumoLib_GetLumoInfo(self.gold, self.uuid, self.out)
        return self.freed(code, self.library.LumoLib_FreeLumoInfo)

    def sizes(self):
        code = self.library.LumoLib_SpaceStatsForLumo(self.gold, self.uuid, self.out)
        return self.freed(code, self.library.LumoLib_FreeLumoSpaceStatsInfo)

    def chunks(self):
        code = self.library.LumoLib_UnsharedChunksLumo(self.gold, self.uuid, 0, 0, 0, 0, 0, self.out)
        return self.freed(code, self.system.free)

    def metadata(self):
        code = self.library.LumoLib_GetLumoMetadata(self.gold, self.uuid, self.out)
        return self.freed(code, self.library.LumoLib_FreeLumoMetadata)

    def nothing_there(self):
        code = self.library.LumoLib_GetLumoInfo(self.gold, NOWHERE.encode(), self.out)
        return self.freed(code, self.library.LumoLib_FreeLumoInfo)

    def nobody_there(self):
        return self.library.LumoLib_DeactivateProvider(b"array-north", b"nobody")

    def no_id(self):
        return self.freed(self.library.LumoLib_GetLumoMetadata(b"x", b"y", self.out), self.library.LumoLib_FreeLumoMetadata)


class Lines:
    """Takes what a process writes, as it comes, and counts its lines."""

    def __init__(self, stream):
        self.count = 0
        self.stream = stream
        self.changed = threading.Condition()
        self.thread = threading.Thread(target=self.take)
        self.thread.start()

    def take(self):
        while data := os.read(self.stream.fileno(), 1 << 16):
            with self.changed:
                self.count += data.count(b"\n")
                self.changed.notify()

    def end(self):
        self.thread.join()
        return self.count

    def wait_for(self, count):
        with self.changed:
            assert self.changed.wait_for(lambda: self.count >= count, timeout=60), (self.count, count)


class Soak(unittest.TestCase):
    def serve(self, box):
        self.assertTrue(box.start())
        box.done("orkaprovider", "add", "--vp-name", "lab", "--vp-url", box.url)
        box.done("storagecontainer", "load")
        return box.daemon_pid()

    def test_fault_62_a_program_on_the_library(self):
        with Host() as box:
            pid = self.serve(box)
            box.done("configlumo", "add", "-n", "vm", "-c", GOLD)
            ((uuid,),) = box.rows(box.array, "SELECT uuid FROM volume WHERE directory_name = 'vm'")
            library = Library(box, uuid)
            succeed = [library.containers, library.volumes, library.information, library.sizes, library.chunks,
                       library.metadata]
            fail = [library.nothing_there, library.nobody_there, library.no_id]
            self.assertEqual(library.reopen(), 0)
            codes = [call() for call in fail]
            self.assertNotIn(0, codes)
            marks = Marks(program=os.getpid(), daemon=pid)
            rounds = CALLS // (len(succeed) + len(fail))
            for done in range(rounds):
                if done % (rounds // 4) == rounds // 4 - 1:
                    marks.take()
                self.assertEqual([call() for call in succeed], [0] * len(succeed))
                self.assertEqual([call() for call in fail], codes)
                if done % 50 == 0:
                    self.assertEqual(library.reopen(), 0)
            marks.hold(self)
            library.library.LumoLib_Exit()
            self.assertEqual(box.stop(), 0)

    def test_fault_62_a_shell_of_many_lines(self):
        with Host() as box:
            daemon = self.serve(box)
            reads = [
                *["storage internal lumo faultInjection enable --enabled true"] * 6,
                *["storage internal lumo nothing"] * 6,
                *["an 'open quote"] * 3,
                "storage internal lumo daemon set --log-level info",
                "storage internal lumo storagecontainer load",
                f"--format json storage internal lumo configlumo mount -n none -c {GOLD}",
                "storage internal lumo storagecontainer load --help",
                "cli describe storage internal lumo orkaprovider add",
            ] * 100
            add, mount, unmount, remove = (f"storage internal lumo configlumo {verb} -n vm -c {GOLD}"
                                           for verb in ("add", "mount", "umount", "remove"))
            batch = [*reads, add, mount, *reads, unmount, remove]
            out, err = self.told_of(box, batch)
            batches = CALLS // len(batch)
            with subprocess.Popen([programs() / "tovicli", "cli", "shell", "--keep-going"], env=box.environment,
                                  stdin=subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.PIPE) as shell:
                told, complained = Lines(shell.stdout), Lines(shell.stderr)
                marks = Marks(shell=shell.pid, daemon=daemon)
                for done in range(1, batches + 1):
                    shell.stdin.write("".join(f"{line}\n" for line in batch).encode())
                    shell.stdin.flush()
                    told.wait_for(done * out)
                    complained.wait_for(done * err)
                    if done % (batches // 4) == 0:
                        marks.take()
                shell.stdin.close()
                self.assertEqual(shell.wait(timeout=60), 2)  # of the first line that failed
                self.assertEqual((told.end(), complained.end()), (batches * out, batches * err))
            marks.hold(self)
            self.assertEqual(box.stop(), 0)

    def told_of(self, box, batch):
        """How many lines a shell writes to its two streams for a batch."""
        lines = box.directory / "lines"
        lines.write_text("\n".join(batch))
        with lines.open("rb") as stdin:
            ended = box.run(programs() / "tovicli", "cli", "shell", "--keep-going", stdin=stdin)
        self.assertIn("has no config volume 'none'", ended.err)
        self.assertIn("Usage", ended.out)
        return ended.out.count("\n"), ended.err.count("\n")


if __name__ == "__main__":
    unittest.main()
