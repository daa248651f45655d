# SPDX-License-Identifier: Apache-2.0
"""What figures were measured on, and when."""
import datetime
import os
import platform
import subprocess


def _line_of(path, word):
    with open(path, encoding="utf-8") as file:
        for line in file:
            if line.startswith(word):
                return line.split(":", 1)[1].strip()
    return "unknown"


def machine():
    """What stays the same from run to run."""
    memory_kib = int(_line_of("/proc/meminfo", "MemTotal").split()[0])
    return {"processor": _line_of("/proc/cpuinfo", "model name"), "cores": os.cpu_count(), "kernel": platform.release(),
            "memory": f"{memory_kib / 2**20:.1f} GiB"}


def moment(top):
    """Where the project stood, when, and how busy the machine was before the measuring began."""
    revision = subprocess.run(["git", "describe", "--always", "--dirty", "--abbrev=10"], cwd=top, text=True,
                              stdout=subprocess.PIPE, stderr=subprocess.DEVNULL).stdout.strip()
    return {"revision": revision or "unknown", "date": datetime.datetime.now(datetime.timezone.utc).strftime("%Y-%m-%d %H:%M UTC"),
            "load": round(os.getloadavg()[0], 2)}
