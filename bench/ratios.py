"""Prints what the benchmarks came to beside what they have to reach.

    ratios.py RESULTS.json RATIOS.txt [--markdown]

RESULTS.json: what a program writes with --benchmark_out. Each line of RATIOS.txt that is neither empty nor a comment is

    what | LIMIT / OURS | >= 0.9        how many times as quick as LIMIT the library is: quotient of their real times
    what | OURS | <= 30 ns              a real time (ns, us, ms, s), or with OURS:COUNTER a counter of the benchmark
    what | OURS | s                     the same without a bound

Of repetitions the medians count. Lines whose benchmarks did not run are left out. Misses are marked; the exit code is 0.
With --markdown the lines are a table.
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
    is_table = "--markdown" in sys.argv
    if is_table:
        print("| what | measured | aim |\n|---|---|---|")
    lookup = lambda text: found.get(tuple((text.strip() + ":").split(":")[:2]))
    for line in pathlib.Path(sys.argv[2]).read_text().splitlines():
        if not line.strip() or line.startswith("#"):
            continue
        what, terms, aim = (part.strip() for part in line.split("|"))
        values = [lookup(term) for term in terms.split(" / ")]
        if None in values:
            continue
        value = values[0] / values[1] if len(values) == 2 else values[0]
        *bound, unit = aim.split() if aim[-1] not in "0123456789." else (*aim.split(), "")
        value /= UNITS[unit]
        holds = not bound or (value >= float(bound[1]) if bound[0] == ">=" else value <= float(bound[1]))
        aim, missed = aim.replace("us", "µs") if bound else "", "" if holds else "MISSED"
        unit = unit.replace("us", "µs")
        if is_table:
            print(f"| {what} | {value:.3g} {unit}".rstrip() + f" | {' '.join((aim, missed)).strip()} |")
        else:
            print(f"{what:<64} {value:10.3g} {unit:<2}  {aim:<12} {missed}".rstrip())


if __name__ == "__main__":
    main()
