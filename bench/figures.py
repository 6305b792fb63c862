"""What is read from the results, and the figures that are made of it."""

import dataclasses
import json
import math
import pathlib
import statistics

BASELINE, OURS = "official", "orv"
PEERS = [OURS, BASELINE, "official-arena", "official-lite", "protozero", "upb", "nanopb", "protobuf-c", "floor"]
FIRST, LATER, SCALING = "first", "later", "scaling"


@dataclasses.dataclass(frozen=True)
class Row:
    """One line of the table: operations whose ratios are taken together."""

    title: str
    operations: tuple


ROWS = [
    Row("decode, fresh", ("decode-fresh",)),
    Row("decode, reused", ("decode-reused",)),
    Row("encode, fresh string", ("encode-fresh",)),
    Row("encode, caller's buffer", ("encode-buffer",)),
    Row("deep copy", ("copy",)),
    Row("equality", ("equal",)),
    Row("refuse", ("refuse-truncated", "refuse-text",
                   "refuse-cut-middle", "refuse-cut-end", "refuse-text-end", "refuse-garbage")),
    Row("build and encode", ("build-encode",)),
    Row("decode and read", ("decode-read",)),
]
MORE_ROWS = [
    Row("two threads at once", ("two-threads",)),
    Row("equality, but for normal form", ("equal-normal-form",)),
    Row("refuse, cut", ("refuse-truncated", "refuse-cut-middle", "refuse-cut-end")),
    Row("refuse, first text ill-formed", ("refuse-text",)),
    Row("refuse, last text ill-formed", ("refuse-last-text", "refuse-text-end")),
    Row("refuse, garbage", ("refuse-garbage",)),
    Row("render as text", ("text",)),
]
OPERATIONS = list(dict.fromkeys(operation for row in ROWS + MORE_ROWS for operation in row.operations))
PER_MEMBER = "per-member"


class Run:
    """The samples of one run, in nanoseconds, by (operation, workload, peer)."""

    def __init__(self, path):
        self.samples, self.sets = {}, {}
        for entry in json.loads(pathlib.Path(path).read_text()):
            self.samples[entry["operation"], entry["workload"], entry["peer"]] = entry["samples"]
            self.sets[entry["operation"], entry["workload"]] = entry["set"]
        self.times = {key: statistics.median(samples) for key, samples in self.samples.items()}

    def ratio_samples(self, operation, workload, peer):
        """The ratios to the baseline, of each round; none where one of the two was not measured."""
        return [ours / theirs
                for ours, theirs in zip(self.samples.get((operation, workload, peer), ()),
                                        self.samples.get((operation, workload, BASELINE), ()))]

    def ratio(self, operation, workload, peer):
        samples = self.ratio_samples(operation, workload, peer)
        return statistics.median(samples) if samples else None

    def quartiles(self, operation, workload, peer):
        """The quartiles of the ratios to the baseline."""
        samples = self.ratio_samples(operation, workload, peer)
        return statistics.quantiles(samples, n=4, method="inclusive")[::2] if len(samples) > 1 else None

    def ratios(self, row, peer, chosen):
        """The ratios of a peer to the baseline, by (operation, workload)."""
        ratios = {key: self.ratio(*key, peer) for key in self.sets
                  if key[0] in row.operations and self.sets[key] == chosen}
        return {key: ratio for key, ratio in ratios.items() if ratio is not None}

    def mean(self, row, peer, chosen):
        ratios = self.ratios(row, peer, chosen).values()
        return math.exp(statistics.fmean(map(math.log, ratios))) if ratios else None

    def worst(self, row, peer, chosen):
        """The worst ratio and the operation and workload that have it."""
        ratios = self.ratios(row, peer, chosen)
        return max(((ratio, key) for key, ratio in ratios.items()), default=None)


class Results:
    """All runs together: medians over the runs."""

    def __init__(self, folder):
        folder = pathlib.Path(folder)
        self.runs = [Run(path) for path in sorted(folder.glob("timing-*.json"))]
        memory = folder / "memory.json"
        self.memory = json.loads(memory.read_text()) if memory.exists() else []
        measured = {name for run in self.runs for (_, _, name) in run.times}
        self.peers = [peer for peer in PEERS if peer in measured]

    def median(self, figure):
        values = [value for value in map(figure, self.runs) if value is not None]
        return statistics.median(values) if values else None

    def mean(self, row, peer, chosen):
        return self.median(lambda run: run.mean(row, peer, chosen))

    def time(self, operation, workload, peer):
        return self.median(lambda run: run.times.get((operation, workload, peer)))

    def ratio(self, operation, workload, peer):
        return self.median(lambda run: run.ratio(operation, workload, peer))

    def quartiles(self, operation, workload, peer):
        """The widest quartiles of all runs."""
        quartiles = list(filter(None, (run.quartiles(operation, workload, peer) for run in self.runs)))
        return (min(low for low, _ in quartiles), max(high for _, high in quartiles)) if quartiles else None

    def workloads(self, operation, chosen):
        """The workloads of an operation, as they were first measured."""
        return list(dict.fromkeys(workload for run in self.runs for (name, workload, _) in run.times
                                  if name == operation and run.sets[name, workload] == chosen))

    def held(self, workload, peer):
        for entry in self.memory:
            if (entry["workload"], entry["peer"]) == (workload, peer):
                return entry
        return None
