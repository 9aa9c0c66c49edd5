#!/usr/bin/env python3
"""Measures, and compares each figure with its target.

  bench/compare.py --build build/bench [NAME...]

Each figure is the ratio of two things measured in the same run, in turns, since machines are noisy: the median of the
one over the median of the other. NAME picks the figures whose name holds it. Exits 1 where a figure falls short.

"table" prints what each class costs by the number of interfaces: the time of EnumerateInstances by its results, and that of
Associators from one source by the interfaces. It has no targets.
"""

import argparse
import dataclasses
import json
import os
import statistics
import subprocess
import sys
import time


@dataclasses.dataclass
class Figure:
    name: str
    limit: float  # the ratio may be at most this
    program: str  # below <build>/bin; "process" for whole processes
    top: str  # the benchmark that is measured
    bottom: str  # what it is measured against
    top_items: int = 1  # the time of each is divided by its number of items
    bottom_items: int = 1


AGENT = [
    Figure("placing a cursor on an unchanged host, to the bare reads that it makes", 3, "agent_bench",
           "PlaceCursor", "BareReads"),
    Figure("placing a cursor while DNS settings have owners, to the bare reads that it makes", 3, "owners_bench",
           "PlaceCursorWithOwners", "BareReadsWithOwners"),
    Figure("reading the whole host, to the raw dumps and file reads that it needs", 2, "agent_bench",
           "ReadHost", "RawDumpsAndReads"),
    Figure("a log pair below the threshold, to one bounded snprintf of the text", 2, "agent_bench",
           "LogPair", "BoundedPrint"),
    Figure("half an entry line with six pointers, to one bounded snprintf of the text", 1, "agent_bench",
           "EntryLineHalf", "BoundedPrintOfEntry"),
]

# By the number of objects: the associations of each class with N interfaces that have one address and two servers; and
# the pairs that the provider compares if it reads both ends.
ASSOCIATIONS = {
    "RemoteAccessAvailableToElement": lambda n: 2 * n,
    "DNSSAPSAPDependency": lambda n: n,
    "DNSHostedAccessPoint": lambda n: n,
    "DNSGeneralElementSettingData": lambda n: 1,
    "DNSGenEndPointElementSettingData": lambda n: n,
    "DNSEndPointElementSettingData": lambda n: n * n,
    "DNSGenOrderedComponent": lambda n: n,
    "DNSOrderedComponent": lambda n: n * n,
}

PROVIDERS = [
    Figure("an endpoint of 1,000, to one by a program that only makes the calls of CMPI", 5, "providers_bench",
           "Endpoints/1000", "StraightEndpoints/1000"),
    Figure("an endpoint of 10,000, to one of 100", 1.5, "providers_bench", "Endpoints/10000", "Endpoints/100", 10000, 100),
    Figure("an endpoint of 1,000, to one of 100", 1.5, "providers_bench", "Endpoints/1000", "Endpoints/100", 1000, 100),
    Figure("an association of 64 servers by 256 endpoints, to one of 8 by 32", 1.5, "providers_bench",
           "RemoteAccess/64/256", "RemoteAccess/8/32", 64 * 256, 8 * 32),
    Figure("setting data from 1,000 files, to four passes over the files", 3, "providers_bench",
           "SettingDataFromFiles", "FourPassesOverFiles"),
] + [
    Figure(f"a pair of {name} at 512 interfaces, to one at 8", 1.5, "providers_bench",
           f"Association/{name}/512", f"Association/{name}/8", pairs(512), pairs(8))
    for name, pairs in ASSOCIATIONS.items()
]

PROCESS = [
    Figure("zorvactl ei ZORVA_DNSProtocolEndPoint, to ip -json addr show", 3, "process",
           "zorvactl ei ZORVA_DNSProtocolEndPoint", "ip -json addr show"),
]

FIGURES = AGENT + PROVIDERS + PROCESS


# Seconds. A source that was unchanged for a while is watched by inotify; beginning to watch may take longer than the measurement.
WARM_UP = 0.1

CANNOT_BE_MEASURED_HERE = 77  # what a program ends with


class CannotBeMeasured(Exception):
    """A program has no host here that it can measure on; the text says what it needs."""


def benchmark_times(build, program, names):
    """The median real time in nanoseconds of each benchmark, repetitions of all of them taken in turns."""
    pattern = "^(" + "|".join(sorted(names)) + ")$"
    command = [os.path.join(build, "bin", program), f"--benchmark_filter={pattern}", "--benchmark_format=json",
               "--benchmark_repetitions=7", "--benchmark_min_time=0.05", "--benchmark_enable_random_interleaving=true"]
    run = subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    if run.returncode == CANNOT_BE_MEASURED_HERE:
        raise CannotBeMeasured(run.stderr.decode().strip())
    run.check_returncode()
    output = run.stdout
    nanoseconds = {"ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}
    times = {}
    for measured in json.loads(output)["benchmarks"]:
        if measured.get("error_occurred"):
            raise RuntimeError(f"{program}: {measured['name']}: {measured['error_message']}")
        if measured.get("run_type") == "iteration":
            times.setdefault(measured["run_name"], []).append(
                measured["cpu_time"] * nanoseconds[measured["time_unit"]])
    missing = set(names) - set(times)
    if missing:
        raise RuntimeError(f"{program} has no benchmark {', '.join(sorted(missing))}")
    return {name: statistics.median(values) for name, values in times.items()}


def process_times(build, commands, turns=41):
    """The median time in nanoseconds of each command as a whole process, taken in turns after one that is not counted."""
    environment = dict(os.environ, PATH=os.path.abspath(os.path.join(build, "bin")) + os.pathsep + os.environ["PATH"])
    times = {command: [] for command in commands}
    for turn in range(turns):
        for command in commands:
            start = time.perf_counter_ns()
            subprocess.run(command.split(), check=True, env=environment, stdout=subprocess.DEVNULL)
            if turn > 0:
                times[command].append(time.perf_counter_ns() - start)
    return {command: statistics.median(values) for command, values in times.items()}


def measure(build, figures):
    results = {}
    for program in dict.fromkeys(figure.program for figure in figures):
        own = [figure for figure in figures if figure.program == program]
        names = dict.fromkeys(name for figure in own for name in (figure.top, figure.bottom))
        print(f"measuring {program} ...", file=sys.stderr)
        try:
            times = process_times(build, names) if program == "process" else benchmark_times(build, program, names)
        except CannotBeMeasured as reason:
            print(f"{program} is left out: {reason}", file=sys.stderr)
            continue
        for figure in own:
            top = times[figure.top] / figure.top_items
            bottom = times[figure.bottom] / figure.bottom_items
            results[figure.name] = (top / bottom, top, bottom)
    return results


def print_table(build):
    """What each class costs by the number of interfaces, in microseconds."""
    command = [os.path.join(build, "bin", "providers_bench"), "--benchmark_filter=^Table", "--benchmark_format=json",
               "--benchmark_min_time=0.05", f"--benchmark_min_warmup_time={WARM_UP}"]
    output = subprocess.run(command, check=True, stdout=subprocess.PIPE, stderr=subprocess.PIPE).stdout
    rows = {}
    for measured in json.loads(output)["benchmarks"]:
        row, interfaces = measured["name"].rsplit("/", 1)
        divisor = measured["results"] if row.startswith("Table/") else int(interfaces)
        rows.setdefault(row, {})[int(interfaces)] = measured["cpu_time"] / 1000 / divisor
    sizes = (10, 100, 1000, 10000)
    for prefix, title in (("Table/", "EnumerateInstances, us for each result"),
                          ("TableFromOne/", "Associators of one object, us for each interface")):
        print(f"\n{title:48}" + "".join(f"{size:>9,}" for size in sizes))
        for row, times in rows.items():
            if row.startswith(prefix):
                name = row[len(prefix):].removeprefix("ZORVA_").replace("/0", ", first end").replace("/1", ", second end")
                print(f"{name:48}" + "".join(f"{times[size]:9.2f}" if size in times else f"{'':9}" for size in sizes))


def human(nanoseconds):
    for unit, size in (("s", 1e9), ("ms", 1e6), ("us", 1e3)):
        if nanoseconds >= size:
            return f"{nanoseconds / size:.3g} {unit}"
    return f"{nanoseconds:.3g} ns"


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--build", default="build/bench", help="the build folder (default: %(default)s)")
    parser.add_argument("names", nargs="*", metavar="NAME", help="only figures whose name holds one of these")
    arguments = parser.parse_args()
    if arguments.names == ["table"]:
        print_table(arguments.build)
        return 0
    figures = [figure for figure in FIGURES
               if not arguments.names or any(name in figure.name for name in arguments.names)]
    if not figures:
        parser.error("no figure has such a name")

    results = measure(arguments.build, figures)
    width = max(len(figure.name) for figure in figures)
    print(f"{'FIGURE':{width}}  RATIO  AT MOST  {'':5}  MEASURED")
    short = 0
    for figure in figures:
        if figure.name not in results:
            continue
        ratio, top, bottom = results[figure.name]
        verdict = "ok" if ratio <= figure.limit else "SHORT"
        short += verdict != "ok"
        print(f"{figure.name:{width}}  {ratio:5.2f}  {figure.limit:7g}  {verdict:5}  {human(top)} / {human(bottom)}")
    if not arguments.names:
        print_table(arguments.build)
    if short:
        print(f"{short} of {len(figures)} figures fall short", file=sys.stderr)
    return 1 if short else 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except (OSError, RuntimeError, subprocess.CalledProcessError) as error:
        print(f"compare.py: {error}", file=sys.stderr)
        sys.exit(1)
