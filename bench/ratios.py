"""Prints what the benchmarks came to beside what they have to reach.

    ratios.py RESULTS.json RATIOS.txt

RESULTS.json: what a program writes with --benchmark_out. Each line of RATIOS.txt that is neither empty nor a comment is

    what | LIMIT / OURS | >= 0.9        how many times as quick as LIMIT the library is: quotient of their real times
    what | OURS | <= 30 ns              a real time (ns, us, ms), or with OURS:COUNTER a counter of the benchmark

Of repetitions the medians count. Lines whose benchmarks did not run are left out. Misses are marked; the exit code is 0.
"""
import json
import pathlib
import statistics
import sys

UNITS = {"": 1, "ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}


def results(path):
    """(name, counter) to the median of its runs; real times in nanoseconds."""
    runs = {}
    for run in json.loads(pathlib.Path(path).read_text())["benchmarks"]:
        if run.get("run_type") == "aggregate" or run.get("error_occurred"):
            continue
        for key, value in run.items():
            if key == "real_time":
                runs.setdefault((run["run_name"], ""), []).append(value * UNITS[run["time_unit"]])
            elif isinstance(value, float):
                runs.setdefault((run["run_name"], key), []).append(value)
    return {key: statistics.median(values) for key, values in runs.items()}


def main():
    found = results(sys.argv[1])
    lookup = lambda text: found.get(tuple((text.strip() + ":").split(":")[:2]))
    for line in pathlib.Path(sys.argv[2]).read_text().splitlines():
        if not line.strip() or line.startswith("#"):
            continue
        what, terms, aim = (part.strip() for part in line.split("|"))
        values = [lookup(term) for term in terms.split(" / ")]
        if None in values:
            continue
        value = values[0] / values[1] if len(values) == 2 else values[0]
        relation, bound, *unit = aim.split()
        scale = UNITS[unit[0] if unit else ""]
        holds = value >= float(bound) * scale if relation == ">=" else value <= float(bound) * scale
        print(f"{what:<64} {value / scale:10.3g} {unit[0] if unit else '':<2}  {aim:<12} {'' if holds else 'MISSED'}".rstrip())


if __name__ == "__main__":
    main()
