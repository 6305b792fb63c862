#!/usr/bin/env python3
"""Prints the tables of what bench/compare measured and, with --write, puts them into docs/performance.md."""

import argparse
import os
import pathlib
import re
import statistics
import subprocess
import time

import plot
from figures import BASELINE, FIRST, LATER, MORE_ROWS, OPERATIONS, OURS, PER_MEMBER, ROWS, SCALING, Results

ROOT = pathlib.Path(__file__).resolve().parent.parent
DOCUMENT = ROOT / "docs" / "performance.md"
BEGIN, END = "<!-- measured: begin -->", "<!-- measured: end -->"


def table(header, rows):
    """A table of Markdown, without the rows that hold nothing."""
    rows = [row for row in rows if not set(row[1:]) <= {"–", "– / –"}]
    if not rows:
        return ""
    lines = [header, ["---"] + ["---:"] * (len(header) - 1), *rows]
    return "\n".join("| " + " | ".join(map(str, line)) + " |" for line in lines)


def ratio(value, places=2):
    if value is None:
        return "–"
    if places == 3:
        return f"{value:.3f}"
    return f"{value:.2f}" if value >= 0.1 else f"{value:.2g}" if value >= 0.0095 else f"{value:.1g}"


def nanoseconds(value):
    if value is None:
        return "–"
    return f"{value:.1f}" if value < 100 else f"{value:,.0f}"


def mean_worst_table(results):
    """Our ratios to the baseline: of each run, and their medians."""
    runs = results.runs if len(results.runs) > 1 else []
    rows = []
    for row in ROWS + MORE_ROWS:
        cells = []
        for chosen in (FIRST, LATER):
            means = [ratio(run.mean(row, OURS, chosen), 3) for run in runs]
            worst = max(filter(None, (run.worst(row, OURS, chosen) for run in results.runs)), default=None)
            cells += [ratio(results.mean(row, OURS, chosen), 3) + (f" ({', '.join(means)})" if means else ""),
                      f"{ratio(worst[0])} ({worst[1][1]})" if worst else "–"]
        rows.append([row.title] + cells)
    return table(["operation", "first workloads, mean", "worst", "later workloads, mean", "worst"], rows)


def peer_table(results, chosen):
    """The geometric mean of every peer, and its worst workload."""
    rows = []
    for row in ROWS + MORE_ROWS:
        cells = []
        for peer in results.peers:
            mean = results.mean(row, peer, chosen)
            worst = max(filter(None, (run.worst(row, peer, chosen) for run in results.runs)), default=None)
            cells.append("–" if mean is None else ratio(mean) + (f" ({ratio(worst[0])})" if peer != BASELINE else ""))
        rows.append([row.title] + cells)
    return table(["operation"] + [f"**{peer}**" if peer == OURS else peer for peer in results.peers], rows)


def slower_table(results):
    """Where we are slower than the baseline."""
    rows = [[operation, workload, with_quartiles(results, operation, workload)]
            for operation in OPERATIONS for chosen in (FIRST, LATER)
            for workload in results.workloads(operation, chosen)
            if (results.ratio(operation, workload, OURS) or 0) > 1]
    return table(["operation", "workload", "ratio"], rows) or "None."


def workload_table(results, chosen):
    """Our ratio for every workload."""
    operations = [operation for operation in OPERATIONS if results.workloads(operation, chosen)]
    names = dict.fromkeys(name for operation in operations for name in results.workloads(operation, chosen))
    rows = [[name] + [with_quartiles(results, operation, name) for operation in operations] for name in names]
    return table(["workload"] + operations, rows)


def with_quartiles(results, operation, name):
    value, quartiles = results.ratio(operation, name, OURS), results.quartiles(operation, name, OURS)
    return ratio(value) + (f" ({ratio(quartiles[0])}–{ratio(quartiles[1])})" if quartiles else "")


def time_table(results, chosen):
    """Nanoseconds, ours and the baseline's; of many messages, for one."""
    operations = ["decode-fresh", "decode-reused", "encode-buffer", "copy", "equal", "equal-normal-form",
                  "hash", "text"]
    operations = [operation for operation in operations if results.workloads(operation, chosen)]
    names = dict.fromkeys(name for operation in operations for name in results.workloads(operation, chosen))
    rows = [[name] + [" / ".join(nanoseconds(results.time(operation, name, peer)) for peer in (OURS, BASELINE))
                      for operation in operations] for name in names]
    return table(["workload"] + operations, rows)


def memory_table(results):
    peers = [peer for peer in results.peers if results.held("envelope", peer)]
    rows = []
    for name in results.workloads("decode-fresh", FIRST):
        cells = []
        for peer in peers:
            held = results.held(name, peer)
            cells.append(f"{held['allocations']:,} / {held['sizeof'] + held['heap']:,}" if held else "–")
        rows.append([name] + cells)
    rows.append(["`sizeof` a group, bytes"] + [results.held("group-1", peer)["sizeof"] for peer in peers])
    return table(["allocations / bytes"] + peers, rows)


def members_of(group):
    return int(group.partition("-")[2])


def per_member_table(results):
    """Nanoseconds to decode and bytes to hold, per member."""
    rows = []
    for name in results.workloads(PER_MEMBER, SCALING):
        members = members_of(name)
        cells = []
        for peer in results.peers:
            spent, held = results.time(PER_MEMBER, name, peer), results.held(name, peer)
            cells.append("–" if spent is None else f"{spent / members:.1f} ns" +
                         (f", {(held['sizeof'] + held['heap']) / members:.0f} B" if held else ""))
        rows.append([f"{members:,}"] + cells)
    return table(["members"] + results.peers, rows)


def steadiness(results):
    """How far the cost per member moves between the smallest group of 100 and the largest."""
    names = [name for name in results.workloads(PER_MEMBER, SCALING) if members_of(name) >= 100]
    times = [results.time(PER_MEMBER, name, OURS) / members_of(name) for name in names]
    sizes = [(held["sizeof"] + held["heap"]) / members_of(name)
             for name in names if (held := results.held(name, OURS))]
    parts = [f"at most {max(values) / min(values) - 1:.0%} more {what}"
             for values, what in ((times, "time"), (sizes, "memory")) if values]
    return f"From 100 members on, `{OURS}` needs {' and '.join(parts)} per member than at best." if parts else ""


def start_up_times(programs, rounds=300):
    """Median microseconds from starting each program to its end; all take turns."""
    times = {program: [] for program in programs}
    for _ in range(rounds):
        for program in programs:
            start = time.perf_counter()
            os.waitpid(os.posix_spawn(program, [program], {}), 0)
            times[program].append((time.perf_counter() - start) * 1e6)
    return {program: statistics.median(values) for program, values in times.items()}


def program_table(results, build):
    names = ["empty"] + [peer for peer in results.peers if peer != "floor"]
    programs = {name: str(build / "bench" / ("bench_minimal_" + name.replace("-", "_"))) for name in names}
    times = start_up_times(list(programs.values()))
    rows = [[name, f"{os.path.getsize(program) / 1024:,.0f} KiB", f"{times[program]:,.0f} µs"]
            for name, program in programs.items()]
    return table(["program", "size, stripped", "start to end"], rows)


def machine(build):
    cache = (build / "CMakeCache.txt").read_text()
    compiler = re.search(r"^CMAKE_CXX_COMPILER:\w+=(.*)$", cache, re.MULTILINE)[1]
    flags = re.search(r"^CMAKE_CXX_FLAGS_RELEASE:\w+=(.*)$", cache, re.MULTILINE)[1]
    version = subprocess.run([compiler, "--version"], capture_output=True, text=True, check=True).stdout
    model = re.search(r"^model name\s*: (.*)$", pathlib.Path("/proc/cpuinfo").read_text(), re.MULTILINE)
    return (f"{model[1] if model else 'unknown processor'}, {os.cpu_count()} cores; "
            f"{version.splitlines()[0]}, `{flags}`, the official runtime linked statically.")


def report(results, build, all_measured):
    runs = len(results.runs)
    sections = [
        f"Measured on {machine(build)} Ratios to the code that protoc generates, with heap objects "
        f"(`{BASELINE}`): below 1 is faster. Medians of interleaved samples"
        + (f", then of {runs} runs, whose figures stand in brackets" if runs > 1 else "")
        + "; the worst is the worst of any run. In brackets after a single ratio stand its quartiles.",
        "### Geometric mean and worst workload", mean_worst_table(results),
        "### Slower than the baseline", slower_table(results),
    ]
    if all_measured:
        sections += [
            "![Ratios of every peer](performance.svg)",
            "### Every peer, first workloads", "Geometric mean and, in brackets, the worst workload.",
            peer_table(results, FIRST),
            "### Every peer, later workloads", peer_table(results, LATER),
        ]
    sections += [
        "### Every workload, ratios", workload_table(results, FIRST), workload_table(results, LATER),
        f"### Every workload, nanoseconds of `{OURS}` and of `{BASELINE}`", time_table(results, FIRST),
        time_table(results, LATER),
        "### Groups of many members, per member", per_member_table(results), steadiness(results),
    ]
    if all_measured:
        sections += [
            "### Memory of a decoded value",
            "Allocations, and bytes held: the object itself and the heap's blocks at their usable size.",
            memory_table(results),
            "### The smallest program",
            "Decodes an envelope and encodes it again; `empty` does nothing at all. All are linked statically.",
            program_table(results, build),
        ]
    return "\n\n".join(section for section in sections if section)


def write(text):
    before, _, rest = DOCUMENT.read_text().partition(BEGIN)
    _, found, after = rest.partition(END)
    if not found:
        raise SystemExit(f"{DOCUMENT} lacks the lines {BEGIN} and {END}")
    DOCUMENT.write_text(f"{before}{BEGIN}\n\n{text}\n\n{END}{after}")


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--write", action="store_true", help="all was measured: also write docs/performance.md and its plot")
    parser.add_argument("build", type=pathlib.Path, help="where bench/compare built and put its results")
    options = parser.parse_args()
    results = Results(options.build / "results")
    text = report(results, options.build, options.write)
    print(text)
    if options.write:
        write(text)
        (ROOT / "docs" / "performance.svg").write_text(plot.svg(results))


if __name__ == "__main__":
    main()
