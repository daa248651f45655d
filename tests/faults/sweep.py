# SPDX-License-Identifier: Apache-2.0
"""Running one program again and again, with another of its system calls going wrong each time.

A run is traced once to learn its calls; then each call is picked in turn and strace makes it fatal (SIGKILL instead of
the call) or makes it fail with an error. A call is picked by its name and its number among those of that name.
"""

import collections
import re
import subprocess

# What a device may refuse because it is full or broken.
WRITING = {"pwrite64", "write", "ftruncate", "fsync", "fdatasync", "unlink", "unlinkat", "rename", "renameat", "renameat2",
           "link", "linkat", "mkdir", "mkdirat", "rmdir", "fchmod"}
# What may leave something half done when it does not happen, or happens last.
CHANGING = WRITING | {"chmod", "fchown", "flock", "bind", "sendto", "sendmsg", "writev"}
# What asks the file system or the daemon and may be told that it cannot be had.
ASKING = {"openat", "openat2", "newfstatat", "fstat", "pread64", "read", "getdents64", "fcntl", "flock", "connect",
          "recvfrom", "recvmsg", "sendto", "sendmsg"}

# What has to do with another's answer, which is where a client and its daemon fall out of step.
ANSWERED = {"recvfrom", "recvmsg", "poll", "connect"}

# What is called as often as it takes until an answer has come; how long to wait is set only where there is a wait.
WAITING = {"recvfrom", "recvmsg", "poll", "setsockopt"}

CALL = re.compile(r"^(?:\d+ +)?(\w+)\((.*)")

# Which call: its name, its number among those of that name, how it begins, and whether it may make a file.
Call = collections.namedtuple("Call", "name number text makes")


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
            calls.append(Call(name, counts[name], match.group(2)[:120], "O_CREAT" in line))
    return calls


def changes(call):
    """Whether others can see that it happened. A kill at a call that only asks leaves what a kill at the next one that
    changes something leaves."""
    return call.makes or call.name in CHANGING


def errors_for(call, asking):
    """What a device may answer to a call: full or broken where something is to be written or made, and, where that is
    looked at too, broken where something is asked."""
    if call.name in WRITING or call.makes:
        return ("EIO", "ENOSPC")
    return ("EIO",) if asking and call.name in ASKING else ()


def tracing(log):
    """The words that run a program under a trace into a file; descriptors are told with what they are."""
    return ["strace", "-yy", "-s", "0", "-o", str(log)]


def injecting(call, what):
    """The words that run a program with one of its calls going wrong: what is "signal=KILL" or "error=EIO"."""
    return ["strace", "-o", "/dev/null", "-e", f"trace={call.name}", "-e",
            f"inject={call.name}:{what}:when={call.number}"]
