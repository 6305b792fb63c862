"""What is read from the results, and the figures that are made of it."""

import dataclasses
import json
import math
import pathlib
import statistics

BASELINE, OURS = "official", "orv"
PEERS = [OURS, BASELINE, "official-arena", "official-lite", "protozero", "nanopb", "protobuf-c", "floor"]
# Those that check text, keep unknown fields and give real presence.
EQUAL_WORK = [BASELINE, "official-arena", "official-lite", "protozero"]


@dataclasses.dataclass(frozen=True)
class Row:
    """One line of the table: operations whose ratios are taken together, and the figures to reach."""

    title: str
    operations: tuple
    mean: float = None
    worst: float = None


ROWS = [
    Row("decode, fresh", ("decode-fresh",), 0.25, 0.50),
    Row("decode, reused", ("decode-reused",), 0.24, 0.72),
    Row("encode, fresh string", ("encode-fresh",), 0.36, 0.68),
    Row("encode, caller's buffer", ("encode-buffer",), 0.24, 0.56),
    Row("deep copy", ("copy",), 0.15, 0.48),
    Row("equality", ("equal",), 0.025, 0.05),
    Row("refuse", ("refuse-truncated", "refuse-text"), 0.05, 0.15),
    Row("equality, but for normal form", ("equal-normal-form",)),
    Row("refuse, last text ill-formed", ("refuse-last-text",)),
    Row("render as text", ("text",)),
]
PER_MEMBER = "per-member"


class Run:
    """The medians of one run, in nanoseconds."""

    def __init__(self, path):
        self.times = {}
        for entry in json.loads(pathlib.Path(path).read_text())["benchmarks"]:
            if entry.get("aggregate_name") == "median":
                self.times[tuple(entry["run_name"].split("/")[:3])] = entry["cpu_time"]

    def ratios(self, row, peer):
        """The ratios of a peer to the baseline, by (operation, workload)."""
        return {(operation, workload): time / self.times[operation, workload, BASELINE]
                for (operation, workload, name), time in self.times.items()
                if name == peer and operation in row.operations
                and (operation, workload, BASELINE) in self.times}

    def mean(self, row, peer):
        ratios = self.ratios(row, peer).values()
        return math.exp(statistics.fmean(map(math.log, ratios))) if ratios else None

    def worst(self, row, peer):
        """The worst ratio and the workload that has it."""
        ratios = self.ratios(row, peer)
        key = max(ratios, key=ratios.get)
        return ratios[key], key[1]

    def ahead_of_equals(self, row):
        means = [self.mean(row, peer) for peer in EQUAL_WORK]
        return all(self.mean(row, OURS) < mean for mean in means if mean is not None)


class Results:
    """All runs together: medians over the runs, and in how many of them something holds."""

    def __init__(self, folder):
        self.runs = [Run(path) for path in sorted(pathlib.Path(folder).glob("timing-*.json"))]
        self.memory = json.loads((pathlib.Path(folder) / "memory.json").read_text())

    def median(self, figure):
        values = [value for value in map(figure, self.runs) if value is not None]
        return statistics.median(values) if values else None

    def mean(self, row, peer):
        return self.median(lambda run: run.mean(row, peer))

    def time(self, operation, workload, peer):
        return self.median(lambda run: run.times.get((operation, workload, peer)))

    def ratio(self, operation, workload, peer):
        row = Row("", (operation,))
        return self.median(lambda run: run.ratios(row, peer).get((operation, workload)))

    def holds(self, condition):
        return sum(map(bool, map(condition, self.runs)))

    def workloads(self, operation):
        """The workloads of an operation, groups by their size."""
        measured = {workload for run in self.runs for (name, workload, _) in run.times if name == operation}
        order = {entry["workload"]: (entry["members"], index)
                 for index, entry in reversed(list(enumerate(self.memory)))}
        return sorted(measured, key=order.get)

    def held(self, workload, peer):
        for entry in self.memory:
            if (entry["workload"], entry["peer"]) == (workload, peer):
                return entry
        return None
