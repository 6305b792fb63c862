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
from figures import BASELINE, EQUAL_WORK, OURS, PEERS, PER_MEMBER, ROWS, Results

ROOT = pathlib.Path(__file__).resolve().parent.parent
DOCUMENT = ROOT / "docs" / "performance.md"
BEGIN, END = "<!-- measured: begin -->", "<!-- measured: end -->"


def table(header, rows):
    """A table of Markdown, without the rows that hold nothing."""
    rows = [row for row in rows if set(row[1:]) != {"–"}]
    lines = [header, ["---"] + ["---:"] * (len(header) - 1), *rows]
    return "\n".join("| " + " | ".join(map(str, line)) + " |" for line in lines)


def ratio(value):
    if value is None:
        return "–"
    return f"{value:.2f}" if value >= 0.1 else f"{value:.2g}" if value >= 0.0095 else f"{value:.1g}"


def nanoseconds(value):
    if value is None:
        return "–"
    return f"{value:.1f}" if value < 100 else f"{value:,.0f}"


def reached_table(results):
    """Our ratios to the baseline beside the figures to reach."""
    runs = len(results.runs)
    rows = []
    for row in ROWS:
        mean = results.mean(row, OURS)
        if mean is None:
            continue
        worst, workload = max(run.worst(row, OURS) for run in results.runs)
        cells = [row.title, f"{mean:.3f}", f"{worst:.3f} ({workload})"]
        if row.mean is None:
            cells += ["–", "–", "–", "–"]
        else:
            good_mean = results.holds(lambda run: run.mean(row, OURS) <= row.mean)
            good_worst = results.holds(lambda run: run.worst(row, OURS)[0] <= row.worst)
            ahead = results.holds(lambda run: run.ahead_of_equals(row))
            cells.append(f"{row.mean} / {row.worst}")
            cells += [f"{count} of {runs}" for count in (good_mean, good_worst, ahead)]
        rows.append(cells)
    return table(["operation", "geometric mean", "worst", "to reach", "mean reached", "worst reached",
                  "ahead of equal work"], rows)


def peer_table(results):
    """The geometric mean of every peer."""
    rows = [[row.title] + [ratio(results.mean(row, peer)) for peer in PEERS] for row in ROWS]
    return table(["operation"] + [f"**{peer}**" if peer == OURS else peer for peer in PEERS], rows)


def workload_table(results):
    """Our ratio for every workload."""
    names = results.workloads("decode-fresh")
    rows = []
    for operation in dict.fromkeys(operation for row in ROWS for operation in row.operations):
        cells = [ratio(results.ratio(operation, name, OURS)) for name in names]
        rows.append([operation] + cells)
    return table(["operation"] + names, rows)


def time_table(results):
    """Nanoseconds, ours and the baseline's."""
    names = results.workloads("decode-fresh")
    rows = []
    for operation in ["decode-fresh", "encode-buffer", "copy", "equal", "equal-normal-form", "hash", "text"]:
        for peer in (OURS, BASELINE):
            rows.append([f"{operation}, {peer}"] +
                        [nanoseconds(results.time(operation, name, peer)) for name in names])
    return table(["operation"] + names, rows)


def memory_table(results):
    peers = [peer for peer in PEERS if results.held("envelope", peer)]
    rows = []
    for name in results.workloads("decode-fresh"):
        cells = []
        for peer in peers:
            held = results.held(name, peer)
            cells.append(f"{held['allocations']:,} / {held['sizeof'] + held['heap']:,}" if held else "–")
        rows.append([name] + cells)
    rows.append(["`sizeof` a group, bytes"] + [results.held("group-1", peer)["sizeof"] for peer in peers])
    return table(["allocations / bytes"] + peers, rows)


def per_member_table(results):
    """Nanoseconds to decode and bytes to hold, per member."""
    rows = []
    for name in results.workloads(PER_MEMBER):
        members = results.held(name, OURS)["members"]
        cells = []
        for peer in PEERS:
            spent, held = results.time(PER_MEMBER, name, peer), results.held(name, peer)
            cells.append("–" if spent is None else f"{spent / members:.1f} ns" +
                         (f", {(held['sizeof'] + held['heap']) / members:.0f} B" if held else ""))
        rows.append([f"{members:,}"] + cells)
    return table(["members"] + PEERS, rows)


def steadiness(results):
    """How far the cost per member moves between the smallest group of 100 and the largest."""
    times, sizes = [], []
    for name in results.workloads(PER_MEMBER):
        held, spent = results.held(name, OURS), results.time(PER_MEMBER, name, OURS)
        if spent is not None and held["members"] >= 100:
            times.append(spent / held["members"])
            sizes.append((held["sizeof"] + held["heap"]) / held["members"])
    if not times:
        return ""
    return (f"From 100 members on, `{OURS}` needs at most {max(times) / min(times) - 1:.0%} more time and "
            f"{max(sizes) / min(sizes) - 1:.0%} more memory per member than at best.")


def start_up_times(programs, rounds=300):
    """Median microseconds from starting each program to its end; all take turns."""
    times = {program: [] for program in programs}
    for _ in range(rounds):
        for program in programs:
            start = time.perf_counter()
            os.waitpid(os.posix_spawn(program, [program], {}), 0)
            times[program].append((time.perf_counter() - start) * 1e6)
    return {program: statistics.median(values) for program, values in times.items()}


def program_table(build):
    names = ["empty"] + [peer for peer in PEERS if peer != "floor"]
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
    linked = "statically" if re.search(r"^ORV_BENCH_STATIC:BOOL=ON$", cache, re.MULTILINE) else "shared"
    return (f"{model[1] if model else 'unknown processor'}, {os.cpu_count()} cores; "
            f"{version.splitlines()[0]}, `{flags}`, the official runtime linked {linked}.")


def report(results, build):
    runs = len(results.runs)
    sections = [
        f"Measured on {machine(build)} Ratios to the code that protoc generates, with heap objects "
        f"(`{BASELINE}`): below 1 is faster. Medians of interleaved repetitions, then of {runs} "
        f"run{'s' * (runs > 1)}; the worst is the worst of all runs.",
        "### Against the figures to reach", reached_table(results),
        f"Equal work means {', '.join(EQUAL_WORK)}: text checked, unknown fields kept, real presence.",
        "![Ratios of every peer](performance.svg)",
        "### Geometric mean of every peer", peer_table(results),
        "### Every workload, ratios", workload_table(results),
        "### Every workload, nanoseconds", time_table(results),
        "### Groups of many members, per member", per_member_table(results), steadiness(results),
        "### Memory of a decoded value",
        "Allocations, and bytes held: the object itself and the heap's blocks at their usable size.",
        memory_table(results),
        "### The smallest program", "Decodes an envelope and encodes it again; `empty` does nothing at all.",
        program_table(build),
    ]
    return "\n\n".join(sections)


def write(text):
    before, _, rest = DOCUMENT.read_text().partition(BEGIN)
    _, found, after = rest.partition(END)
    if not found:
        raise SystemExit(f"{DOCUMENT} lacks the lines {BEGIN} and {END}")
    DOCUMENT.write_text(f"{before}{BEGIN}\n\n{text}\n\n{END}{after}")


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--write", action="store_true", help="also write docs/performance.md and its plot")
    parser.add_argument("build", type=pathlib.Path, help="where bench/compare built and put its results")
    options = parser.parse_args()
    results = Results(options.build / "results")
    text = report(results, options.build)
    print(text)
    if options.write:
        write(text)
        (ROOT / "docs" / "performance.svg").write_text(plot.svg(results))


if __name__ == "__main__":
    main()
