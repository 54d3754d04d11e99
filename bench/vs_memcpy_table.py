#!/usr/bin/env python3
"""Reads the JSON report of bitfcns_bench on stdin and prints a Markdown table
of each case: time per call, bytes per second and the vs_memcpy ratio. With
repetitions, only the medians are shown."""
import json
import sys

report = json.load(sys.stdin)
runs = report["benchmarks"]
if any(run.get("aggregate_name") for run in runs):
    runs = [run for run in runs if run.get("aggregate_name") == "median"]

print("| case | time per call | GB/s | vs_memcpy |")
print("|---|---:|---:|---:|")
for run in runs:
    name = run["run_name"].removesuffix("/real_time")
    unit = run["time_unit"]
    seconds = run["real_time"] * {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1.0}[unit]
    time = f"{seconds * 1e6:.3f} us" if seconds < 1e-3 else f"{seconds * 1e3:.2f} ms"
    # Cases that count items, or nothing, rather than bytes have no ratio.
    rate = f"{run['bytes_per_second'] / 1e9:.1f}" if "bytes_per_second" in run else "-"
    ratio = f"{run['vs_memcpy']:.2f}" if "vs_memcpy" in run else "-"
    print(f"| {name} | {time} | {rate} | {ratio} |")
