"""Prints what volume_compare measured as tables in Markdown.

    tables.py BOTH.json ONE.json

What the program writes with --benchmark_out: on all cores, and bound to one of them. Of repetitions the quickest counts, in
ratios the median.
"""
import collections
import datetime
import json
import pathlib
import statistics
import sys

RADII = (125, 500)
LEVELS = (1, 9)
SIDES = ("SmallTiles", "WideTiles", "Peer")
NANOSECONDS = {"ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}


class Results:
    def __init__(self, path):
        self.runs = {}
        self.times = collections.defaultdict(list)
        for run in json.loads(pathlib.Path(path).read_text())["benchmarks"]:
            if run.get("run_type") == "aggregate":
                continue
            if run.get("error_occurred"):
                sys.exit(f"{run['run_name']}: {run['error_message']}")
            name = run["run_name"].removesuffix("/real_time")
            run["time"] = run["real_time"] * NANOSECONDS[run["time_unit"]]
            self.times[name].append(run["time"])
            if name not in self.runs or run["time"] < self.runs[name]["time"]:
                self.runs[name] = run

    def __call__(self, name, arguments="", key="time"):
        """Of the quickest run, the time in nanoseconds or a counter; nothing for a case that there is not."""
        run = self.runs.get("/".join(filter(None, (name, arguments))))
        return run and run[key]

    def median(self, name, arguments):
        return statistics.median(self.times[f"{name}/{arguments}"])


def number(value):
    """With three digits."""
    return f"{value:.3g}" if value < 1000 else f"{value:.0f}"


def cell(values, scale, unit):
    values = [number(value / scale) for value in values if value is not None]
    return f"{' / '.join(values)} {unit}" if values else ""


def row(what, unit, scale, runs_of):
    """runs_of(side): the values of its cell."""
    print("| " + " | ".join([what, *(cell(runs_of(side), scale, unit) for side in SIDES)]) + " |")


def name_of(side, ours, peer):
    return peer if side == "Peer" else f"{ours}<{side}>"


def main():
    both, one = (Results(path) for path in sys.argv[1:])

    def on_threads(ours, peer, further="", key="time"):
        return lambda side: [both(name_of(side, ours, peer), f"threads:{count}{further}", key) for count in (1, 2)]

    def on_cores(ours, peer):
        arguments = lambda side: "" if side == "Peer" else f"level:9/radius:{RADII[0]}"
        return lambda side: [results(name_of(side, ours, peer), arguments(side)) for results in (one, both)]

    def counted(ours, peer, key, arguments=("", "")):
        return lambda side: [both(name_of(side, ours, peer), arguments[side == "Peer"], key)]

    print(f"Measured on {datetime.date.today()}.\n")
    print("| what | small tiles | wide tiles | OpenVDB |\n|---|---|---|---|")
    one_thread = ("threads:1", "threads:1")
    row("voxels held", "million", 1e6, counted("buildSphere", "buildPeer", "held", one_thread))
    row("memory", "MB", 1, counted("buildSphere", "buildPeer", "MB", one_thread))
    row("build, one thread / two", "ms", 1e6, on_threads("buildSphere", "buildPeer"))
    row("build, a voxel held, one thread / two", "ns", 1e-9, on_threads("buildSphere", "buildPeer", key="perVoxel"))
    row("build from a list of the band's voxels in order, one thread / two (OpenVDB: one)", "ms", 1e6,
        on_threads("buildFromVoxelList", "buildFromListPeer", "/shuffled:0"))
    row("build from the same list shuffled, one thread / two (OpenVDB: one)", "ms", 1e6,
        on_threads("buildFromVoxelList", "buildFromListPeer", "/shuffled:1"))
    row("visit every value of the band, one thread / two", "ms", 1e6, on_threads("visitOurs", "visitPeer"))
    row("random read by accessor, one thread / two", "ns", 1, on_threads("readAtRandom", "readPeer"))
    row("box around the content, one thread / two (OpenVDB: around active voxels, whatever their values)", "ms", 1e6,
        on_threads("boundsOfContent", "boundsPeer"))
    row("save, level 9 (OpenVDB: blosc), one core / all", "ms", 1e6, on_cores("saveOurs", "savePeer"))
    row("load, one core / all", "ms", 1e6, on_cores("loadOurs", "loadPeer"))
    row("file", "MB", 1, counted("saveOurs", "savePeer", "file MB", (f"level:9/radius:{RADII[0]}", "")))

    print("\n| small tiles, all cores, against the compressor alone on the same bytes | "
          + " | ".join(f"{what}, level {level}" for what in ("save", "load") for level in LEVELS) + " |")
    print("|---|---|---|---|---|")
    for radius in RADII:
        ratios = []
        for what in ("save", "load"):
            for level in LEVELS:
                arguments = f"level:{level}/radius:{radius}"
                bare, ours = (both.median(f"{what}{side}<SmallTiles>", arguments) for side in ("Bare", "Ours"))
                ratios.append(bare / ours)
        print(f"| radius {radius} | " + " | ".join(f"{ratio:.2f}" for ratio in ratios) + " |")


if __name__ == "__main__":
    main()
