# SPDX-License-Identifier: Apache-2.0
"""Running one program again and again, with another of its system calls going wrong each time.

A run is traced once to learn its calls; then each call is picked in turn and strace makes it fatal (SIGKILL instead of
the call) or makes it fail with an error. A call is picked by its name and its number among those of that name.
"""

import collections
import re
import subprocess

# What may leave something half done when it does not happen, or happens last.
CHANGING = {"pwrite64", "write", "ftruncate", "fsync", "fdatasync", "unlink", "unlinkat", "rename", "renameat",
            "renameat2", "link", "linkat", "mkdir", "mkdirat", "rmdir", "fchmod", "flock", "sendto", "sendmsg",
            "recvfrom", "recvmsg", "poll", "connect"}
# What a device may refuse because it is full or broken.
WRITING = {"pwrite64", "write", "ftruncate", "fsync", "fdatasync", "unlink", "unlinkat", "rename", "renameat", "renameat2",
           "link", "linkat", "mkdir", "mkdirat", "rmdir", "fchmod"}
# What asks the file system or the daemon and may be told that it cannot be had.
ASKING = {"openat", "openat2", "newfstatat", "fstat", "pread64", "read", "getdents64", "fcntl", "flock", "connect",
          "recvfrom", "recvmsg", "sendto", "sendmsg"}

# What is called as often as it takes until an answer has come; how long to wait is set only where there is a wait.
WAITING = {"recvfrom", "recvmsg", "poll", "setsockopt"}

CALL = re.compile(r"^(?:\d+ +)?(\w+)\((.*)")

Call = collections.namedtuple("Call", "name number text")


def can_trace():
    return subprocess.run(["strace", "-o", "/dev/null", "true"], check=False, capture_output=True).returncode == 0


def calls_of(log, of_interest):
    """The calls in a trace that mention one of these texts, each with its number among all of its name."""
    counts = collections.Counter()
    calls = []
    for line in log.read_text(errors="replace").splitlines():
        match = CALL.match(line)
        if not match or "resumed>" in line:
            continue
        name = match.group(1)
        counts[name] += 1
        if any(text in line for text in of_interest):
            calls.append(Call(name, counts[name], match.group(2)[:120]))
    return calls


def tracing(log):
    """The words that run a program under a trace into a file; descriptors are told with what they are."""
    return ["strace", "-yy", "-s", "0", "-o", str(log)]


def injecting(call, what):
    """The words that run a program with one of its calls going wrong: what is "signal=KILL" or "error=EIO"."""
    return ["strace", "-o", "/dev/null", "-e", f"trace={call.name}", "-e",
            f"inject={call.name}:{what}:when={call.number}"]
