# SPDX-License-Identifier: Apache-2.0
"""Where a command's time goes between its start and its exit, from tools that look at it from outside.

- time: samples of the processor's clock (`perf record -e cpu-clock`), in kernel and program, many runs together
- page faults: each one, with the address that was missing (`perf record -e page-faults -d`)
- relocations: what the dynamic linker counts (`LD_DEBUG=statistics`); look-ups of symbols: each one (`LD_DEBUG=bindings`)
- instructions: all of them, by the library they stand in (`valgrind --tool=callgrind`)
- system calls: `strace`, with what `mmap` maps
"""
import collections
import os
import pathlib
import re
import subprocess
import tempfile

from harness.figures import median

SAMPLES_A_SECOND = 20000

# What the kernel did, by a function that stands in a sample's chain of callers; the first that fits counts.
KERNEL_WORK = (
    ("kernel: start of the program", r"__x64_sys_execve|bprm_execve|ret_from_fork|schedule_tail"),
    ("kernel: end of the program", r"do_exit|do_group_exit|mmput"),
    ("kernel: page faults", r"exc_page_fault"),
    ("kernel: mapping, protecting", r"__x64_sys_(mmap|munmap|mprotect|brk)|ksys_mmap_pgoff"),
    ("kernel: sockets", r"__sys_(connect|sendto|recvfrom|socket|sendmsg|recvmsg|getsockopt)|do_sys_poll|__x64_sys_poll"),
    ("kernel: files", r"__x64_sys_(openat|newfstat|newfstatat|read|pread64|close|access|faccessat|lseek|fcntl|readlink)|ksys_"),
)
FIRST_ROWS = [name for name, _ in KERNEL_WORK] + ["kernel: the rest"]


def short(path):
    """How a table names what a page or an instruction belongs to."""
    name = os.path.basename(path)
    if name.startswith("//anon") or name in ("[heap]", "anon"):
        return "heap and other memory"
    if name.startswith("[stack"):
        return "stack"
    if name.startswith("ld-linux"):
        return "ld.so"
    if path.startswith("/proc/self/fd/"):
        return "the plug-in, by its descriptor"
    if name in ("???", "?"):
        return "unknown"
    return re.sub(r"\.so\..*$", ".so", name)


def kernel_work(chain):
    for name, pattern in KERNEL_WORK:
        if re.search(pattern, chain):
            return name
    return "kernel: the rest"


def time_by_work(text, program):
    """Nanoseconds by what they were spent on, of all the processes that became the program, from `perf script`."""
    blocks = []
    names = {}
    for block in text.split("\n\n"):
        lines = block.strip().splitlines()
        head = re.match(r"(.*?)\s+(\d+)\s+(\d+)\s*$", lines[0]) if lines else None
        if head and len(lines) > 1:
            # A process samples as its parent until it has become the program.
            names[head[2]] = head[1].strip()
            blocks.append((head[2], int(head[3]), lines[1:]))
    spent = collections.Counter()
    for pid, period, frames in blocks:
        if names[pid] != program[:15]:
            continue
        place = re.search(r"\(([^()]*)\)\s*$", frames[0])
        library = place[1] if place else "[unknown]"
        if library.startswith("[kernel") or library.endswith(".ko"):
            spent[kernel_work("\n".join(frames))] += period
        else:
            spent["program: " + short(library)] += period
    return spent


def faults_by_place(text):
    """Page faults by what the missing page belongs to, from `perf script -F addr,ip,sym,dso` with `-d`."""
    faults = collections.Counter()
    for line in text.splitlines():
        # "ADDRESS SYMBOL (WHAT IT IS IN)  IP SYMBOL (WHOSE CODE)"; a symbol may hold parentheses itself.
        owner = re.search(r"\(((?:/|\[|//)[^()]*|inode[^()]*|anon[^()]*|memfd[^()]*)\)\s+[0-9a-f]{6,16} ", line)
        if owner:
            faults[short(owner[1])] += 1
    return faults


def instructions_by_library(text):
    """Instructions by the library that they stand in, from a callgrind file."""
    names, counts, library, is_call = {}, collections.Counter(), "?", False
    for line in text.splitlines():
        if is_call:  # the cost of what was called, which is counted where it was spent
            is_call = False
        elif match := re.match(r"(c?)ob=\((\d+)\)(?: (.*))?$", line):
            if match[3] is not None:
                names[match[2]] = match[3]
            if not match[1]:
                library = short(names[match[2]])
        elif line.startswith("calls="):
            is_call = True
        elif re.match(r"[0-9+*-]", line):
            counts[library] += int(line.split()[-1])
    # valgrind's own are no part of the program.
    return collections.Counter({name: count for name, count in counts.items() if not name.startswith("vgpreload")})


def bindings_by_library(text):
    """Look-ups of symbols by the library that wants them, from LD_DEBUG=bindings."""
    return collections.Counter(short(match) for match in re.findall(r"binding file (\S+) \[\d+\] to", text))


def linker_statistics(text):
    """The counts of LD_DEBUG=statistics: relocations at the start and at the end."""
    def last(pattern):
        found = re.findall(pattern + r": (\d+)", text)
        return int(found[-1]) if found else 0
    return {"relocations with a symbol": last(r"number of relocations"),
            "relocations without one": last(r"number of relative relocations")}


def system_calls(text):
    """System calls by name, and the bytes that mmap mapped from files."""
    calls, mapped = collections.Counter(), 0
    for line in text.splitlines():
        if match := re.match(r"(?:\d+ +)?(\w+)\(", line):
            calls[match[1]] += 1
            mapping = re.match(r"(?:\d+ +)?mmap\(\w+, (\d+), .*, (-?\d+), \w+\) += 0x", line)
            if mapping and mapping[2] != "-1":
                mapped += int(mapping[1])
    return calls, mapped


class Profiler:
    """Profiles commands of one build, on one host that runs."""

    def __init__(self, build, env):
        self.build, self.env = build, env

    def _run(self, command, **more):
        env = {**self.env, **more}
        done = subprocess.run([str(word) for word in command], env=env, text=True, stdin=subprocess.DEVNULL,
                              stdout=subprocess.PIPE, stderr=subprocess.PIPE)
        if done.returncode != 0:
            raise RuntimeError(f"{' '.join(map(str, command))} failed: {done.stderr.strip()[-300:]}")
        return done

    def times(self, command, rounds, scratch):
        """Milliseconds on the processor by work, for the command and for the program that does nothing, of one run; and
        the medians of the whole time."""
        data = scratch / "times.data"
        pair = [self.build.program("bench_pair"), rounds, *command, "--", self.build.program("bench_nothing")]
        # Walls are taken without a profiler, which would be in them.
        walls = [tuple(map(int, line.split())) for line in self._run(pair).stdout.splitlines()]
        self._run(["perf", "record", "-q", "-o", data, "-e", "cpu-clock", "-F", SAMPLES_A_SECOND, "-g", "--", *pair])
        text = self._run(["perf", "script", "-i", data, "-F", "comm,pid,period,ip,sym,dso"]).stdout
        runs = rounds + 3  # bench_pair's warm-ups
        def each(program):
            return {work: spent / runs / 1e6 for work, spent in time_by_work(text, program).items()}
        name = os.path.basename(command[0])
        ours, floor = (median(column) / 1e6 for column in zip(*walls))
        return {"wall": ours, "work": each(name)}, {"wall": floor, "work": each("bench_nothing")}

    def counts(self, command, scratch):
        """What can be counted: the same in every run, but for a few page faults."""
        data, calls_file, costs = scratch / "faults.data", scratch / "calls", scratch / "costs"
        self._run(["perf", "record", "-q", "-o", data, "-e", "page-faults", "-c", "1", "-d", "--", *command])
        faults = faults_by_place(self._run(["perf", "script", "-i", data, "-F", "addr,ip,sym,dso"]).stdout)
        self._run(["valgrind", "--tool=callgrind", "-q", f"--callgrind-out-file={costs}", *command])
        bindings = bindings_by_library(self._run(command, LD_DEBUG="bindings").stderr)
        statistics = linker_statistics(self._run(command, LD_DEBUG="statistics").stderr)
        self._run(["strace", "-f", "-o", calls_file, *command])
        calls, mapped = system_calls(calls_file.read_text(encoding="utf-8", errors="replace"))
        instructions = instructions_by_library(costs.read_text(encoding="utf-8", errors="replace"))
        return {"faults": faults, "instructions": instructions, "bindings": bindings, "calls": calls, "mapped": mapped,
                **statistics}


def profile(build, env, commands, rounds):
    """@return figures of each command, and of the program that does nothing, in the order of the commands."""
    profiler = Profiler(build, env)
    result = {}
    with tempfile.TemporaryDirectory(prefix="tovi-profile.") as scratch:
        scratch = pathlib.Path(scratch)
        nothing = [build.program("bench_nothing")]
        for name, command in commands:
            ours, floor = profiler.times(command, rounds, scratch)
            # Each command is compared with the turns that were beside its own; the first one's serve the column.
            if not result:
                result["nothing"] = {**floor, "floor": floor, **profiler.counts(nothing, scratch)}
            result[name] = {**ours, "floor": floor, **profiler.counts(command, scratch)}
    return result


def table(head, rows):
    lines = ["| " + " | ".join(head) + " |", "|" + "---|" * len(head)]
    return lines + ["| " + " | ".join(row) + " |" for row in rows]


def render(result):
    """The profile as Markdown."""
    names = list(result)
    head = ["", *(f"`{name}`" for name in names)]
    works = {work for name in names for work in result[name]["work"]}
    libraries = sorted((w for w in works if w.startswith("program")),
                       key=lambda work: -sum(result[name]["work"].get(work, 0) for name in names))
    big = [work for work in libraries if max(result[name]["work"].get(work, 0) for name in names) >= 0.005]
    rows = [["start to exit, milliseconds, not sampled"] + [f"{result[name]['wall']:.2f}" for name in names],
            ["the same of the floor, in turns with it"] + [f"{result[name]['floor']['wall']:.2f}" for name in names]]

    def shares(spent):
        # Sampling makes a run longer; shares of the floor say the same with and without.
        return [f"{spent(result[name]['work']) * 100 / sum(result[name]['floor']['work'].values()):.1f}" for name in names]
    rows.append(["on the processor in all", *shares(lambda work: sum(work.values()))])
    for which in [*(row for row in FIRST_ROWS if row in works), *big]:
        rows.append([which, *shares(lambda work, which=which: work.get(which, 0))])
    lines = ["Time on the processor, in hundredths of what the program takes in all that does nothing (what is left of the whole",
             "time is waiting):", "", *table(head, rows), ""]

    def total(key):
        return [f"{sum(result[name][key].values()):,}" for name in names]
    counts = [["libraries loaded"] + [str(sum(1 for where in result[name]["instructions"] if ".so" in where)) for name in names],
              ["instructions"] + total("instructions"),
              ["relocations with a symbol"] + [f"{result[name]['relocations with a symbol']:,}" for name in names],
              ["relocations without one"] + [f"{result[name]['relocations without one']:,}" for name in names],
              ["symbols looked up"] + total("bindings"),
              ["page faults"] + total("faults"),
              ["system calls"] + total("calls"),
              ["of these mmap, mprotect, munmap"]
              + [str(sum(result[name]["calls"].get(call, 0) for call in ("mmap", "mprotect", "munmap"))) for name in names],
              ["bytes mapped from files"] + [f"{result[name]['mapped']:,}" for name in names]]
    lines += ["Counts of one run:", "", *table(head, counts), ""]

    for key, title in (("faults", "Page faults by what the page belongs to"), ("instructions", "Instructions by where they stand"),
                       ("bindings", "Symbols looked up by who wants them")):
        places = collections.Counter()
        for name in names:
            places.update(result[name][key])
        rows = [[place] + [f"{result[name][key].get(place, 0):,}" for name in names] for place, _ in places.most_common(14)]
        lines += [title + ":", "", *table(head, rows), ""]
    return lines
