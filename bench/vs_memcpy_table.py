#!/usr/bin/env python3
"""Reads the JSON report of bitfcns_bench on stdin and prints a Markdown table
of each case: time per call, bytes per second and the vs_memcpy ratio. With
repetitions, only the medians are shown.

With --by-count, one row per case and, for each element count in the report,
a column of the time per call and the vs_memcpy ratio: the shape of the
tables that show every path at a few counts side by side."""
import argparse
import json
import re
import sys


def time_text(run):
    unit = run["time_unit"]
    seconds = run["real_time"] * {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1.0}[unit]
    return f"{seconds * 1e6:.3f} us" if seconds < 1e-3 else f"{seconds * 1e3:.2f} ms"


def ratio_text(run):
    # Cases that count items, or nothing, rather than bytes have no ratio.
    return f"{run['vs_memcpy']:.2f}" if "vs_memcpy" in run else "-"


def plain_table(runs):
    print("| case | time per call | GB/s | vs_memcpy |")
    print("|---|---:|---:|---:|")
    for run in runs:
        name = run["run_name"].removesuffix("/real_time")
        rate = f"{run['bytes_per_second'] / 1e9:.1f}" if "bytes_per_second" in run else "-"
        print(f"| {name} | {time_text(run)} | {rate} | {ratio_text(run)} |")


def count_text(count):
    """5e7 for 50000000, the digits where they don't end in zeros."""
    digits = str(count).rstrip("0")
    zeros = len(str(count)) - len(digits)
    return f"{digits}e{zeros}" if len(digits) == 1 and zeros > 1 else str(count)


def table_by_count(runs):
    cells, counts = {}, set()
    for run in runs:
        match = re.fullmatch(r"(.*)/n:(\d+)", run["run_name"].removesuffix("/real_time"))
        if not match:
            continue
        case, count = match[1], int(match[2])
        counts.add(count)
        cells.setdefault(case, {})[count] = f"{time_text(run)}, {ratio_text(run)}"
    counts = sorted(counts)
    print("| case | " + " | ".join(f"n = {count_text(c)}" for c in counts) + " |")
    print("|---|" + "---:|" * len(counts))
    for case, row in cells.items():
        print(f"| {case} | " + " | ".join(row.get(c, "") for c in counts) + " |")


parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
parser.add_argument("--by-count", action="store_true", help="a column per element count")
arguments = parser.parse_args()
report = json.load(sys.stdin)
runs = report["benchmarks"]
if any(run.get("aggregate_name") for run in runs):
    runs = [run for run in runs if run.get("aggregate_name") == "median"]
(table_by_count if arguments.by_count else plain_table)(runs)
