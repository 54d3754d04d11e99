#!/usr/bin/python3
"""Times each function of the library against what a NumPy user would write
for it, at the same element counts and in the same run, and reports the
ratio of the times (NumPy over the library: above 1 the library is faster).

The library's side is bitfcns_bench, run once per case with a filter; its
cases are calls through the entry points with a result the host allocates
per call. NumPy's side is the equivalent expression on preallocated inputs,
its result allocated by every call; each count is timed like timeit: one
untimed call, a batch of calls grown until it lasts --min-time, then
--repetitions batches, of which the median time per call counts (the library
reports the median of as many repetitions of its own).

Doubles take NumPy's usual idiom: check that every value is finite, whole
and in range, convert to uint64, operate, convert back to double.

Prints the machine, NumPy's version and SIMD dispatch, a Markdown table of
ratios and one of times, and writes a log-log plot of elements per second
against the count, a panel per function, to OUT/compare_numpy.png.

    /usr/bin/python3 bench/compare_numpy.py [--quick] [--bench PATH] [--out DIR]
"""
import argparse
import gc
import json
import os
import platform
import re
import statistics
import subprocess
import sys
import textwrap
import time
from dataclasses import dataclass
from pathlib import Path
from typing import Callable

import matplotlib

matplotlib.use("Agg")
import matplotlib.pyplot as plt  # noqa: E402
import numpy as np  # noqa: E402

COUNTS = [1000, 100000, 5000000, 50000000]
QUICK_COUNTS = [1000, 5000000]
FUNCTIONS = ["bitand", "bitor", "bitxor", "bitcmp", "bitget", "bitset", "bitshift"]
UINT64_END = 2.0**64


# ---------------------------------------------------------------- operands
# The same values as the library's cases, so that both sides convert alike.

def golden(n):
    return np.arange(n, dtype=np.uint64) * np.uint64(2654435761)


def small_values(n, dtype, seed=0):
    """(i * 2654435761 + seed) % 251: the operands of bitand and bitget."""
    return ((golden(n) + np.uint64(seed)) % np.uint64(251)).astype(dtype)


def wrapped_values(n, dtype):
    """i * 2654435761 cut to the class: the operands of bitcmp and bitshift."""
    return golden(n).astype(dtype)


def bitcmp_doubles(n):
    """Multiples of 2^60, whose uint64 complements are whole doubles again."""
    return (np.arange(n, dtype=np.uint64) % np.uint64(15) + np.uint64(1)).astype(np.float64) * 2.0**60


def bitset_values(n, dtype):
    return golden(n).astype(np.uint32).astype(dtype)


def positions(n, dtype, width):
    return (np.arange(n, dtype=np.uint64) * np.uint64(7) % np.uint64(width) + np.uint64(1)).astype(dtype)


# ------------------------------------------------------- the NumPy idioms

def as_uint64(x, low=0.0, end=UINT64_END):
    """Every value finite, whole and in [low, end), as uint64; else an error."""
    if not (np.array_equal(np.trunc(x), x) and x.min() >= low and x.max() < end):
        raise ValueError("values must be whole numbers in range")
    return x.astype(np.uint64)


def shift_by_array(a, counts):
    """a shifted left by each count, right by the magnitude of a negative one."""
    magnitude = np.abs(counts).astype(a.dtype)
    out = np.left_shift(a, magnitude)
    np.right_shift(a, magnitude, out=out, where=counts < 0)
    return out


@dataclass
class Case:
    function: str  # the plot's panel
    label: str  # the line in the panel
    library: str  # bitfcns_bench's case, less "/n:N"
    numpy: str  # what NumPy runs, for the table
    setup: Callable[[int], Callable[[], object]]  # count -> the call, inputs made


def logic_cases():
    cases = []
    for function, ufunc in (("bitand", np.bitwise_and), ("bitor", np.bitwise_or),
                            ("bitxor", np.bitwise_xor)):
        name = ufunc.__name__
        for dtype in (np.uint8, np.uint64):
            def setup(n, dtype=dtype, ufunc=ufunc):
                a, b = small_values(n, dtype, 1), small_values(n, dtype, 7)
                return lambda: ufunc(a, b)
            cls = np.dtype(dtype).name
            cases.append(Case(function, cls, f"{function}/onInteger/{cls}/fresh", f"{name}(a, b)", setup))

        def setup_scalar(n, ufunc=ufunc):
            a, scalar = small_values(n, np.uint8, 1), np.uint8(3)
            return lambda: ufunc(a, scalar)
        cases.append(Case(function, "uint8, scalar", f"{function}/onInteger/uint8-doubleScalar/fresh",
                          f"{name}(a, 3)", setup_scalar))

        def setup_double(n, ufunc=ufunc):
            a, b = small_values(n, np.float64, 1), small_values(n, np.float64, 7)
            return lambda: ufunc(as_uint64(a), as_uint64(b)).astype(np.float64)
        cases.append(Case(function, "double", f"{function}/onDouble/double/fresh",
                          f"{name}(check(a), check(b)).astype(f8)", setup_double))
    return cases


def bitcmp_cases():
    cases = []
    for dtype in (np.uint8, np.uint64):
        def setup(n, dtype=dtype):
            a = wrapped_values(n, dtype)
            return lambda: np.invert(a)
        cls = np.dtype(dtype).name
        cases.append(Case("bitcmp", cls, f"bitcmp/onInteger/{cls}/fresh", "invert(a)", setup))

    def setup_double(n):
        a = bitcmp_doubles(n)
        return lambda: np.invert(as_uint64(a)).astype(np.float64)
    cases.append(Case("bitcmp", "double", "bitcmp/onDouble/double/fresh",
                      "invert(check(a)).astype(f8)", setup_double))
    return cases


def bitget_cases():
    cases = []
    for dtype in (np.uint8, np.uint64):
        cls, t = np.dtype(dtype).name, dtype

        def setup_scalar(n, dtype=dtype, t=t):
            a, shift, one = small_values(n, dtype), t(3 - 1), t(1)
            return lambda: (a >> shift) & one

        def setup_array(n, dtype=dtype, t=t):
            a, p = small_values(n, dtype), positions(n, dtype, 8 * np.dtype(dtype).itemsize)
            one = t(1)
            return lambda: (a >> (p - one)) & one
        cases.append(Case("bitget", f"{cls}, one position", f"bitget/onInteger/{cls}/scalarPosition/fresh",
                          "(a >> (p - 1)) & 1", setup_scalar))
        cases.append(Case("bitget", f"{cls}, positions", f"bitget/onInteger/{cls}/positionArray/fresh",
                          "(a >> (p - 1)) & 1, p array", setup_array))

    def setup_double_scalar(n):
        a, shift, one = small_values(n, np.float64), np.uint64(3 - 1), np.uint64(1)
        return lambda: ((as_uint64(a) >> shift) & one).astype(np.float64)

    def setup_double_array(n):
        a, p, one = small_values(n, np.float64), positions(n, np.float64, 64), np.uint64(1)
        return lambda: ((as_uint64(a) >> (as_uint64(p, 1, 65) - one)) & one).astype(np.float64)
    cases.append(Case("bitget", "double, one position", "bitget/onDouble/double/scalarPosition/fresh",
                      "((check(a) >> (p - 1)) & 1).astype(f8)", setup_double_scalar))
    cases.append(Case("bitget", "double, positions", "bitget/onDouble/double/positionArray/fresh",
                      "((check(a) >> (check(p) - 1)) & 1).astype(f8)", setup_double_array))
    return cases


def bitset_cases():
    cases = []
    bit = 1 << (5 - 1)  # the library's cases set or clear position 5
    for dtype in (np.uint8, np.uint64):
        cls, t = np.dtype(dtype).name, dtype

        def setup_set(n, dtype=dtype, t=t):
            a, mask = bitset_values(n, dtype), t(bit)
            return lambda: a | mask

        def setup_clear(n, dtype=dtype, t=t):
            a, mask = bitset_values(n, dtype), ~t(bit)
            return lambda: a & mask
        cases.append(Case("bitset", f"{cls}, set", f"bitset/onInteger/{cls}/scalarBit/noValue/fresh",
                          "a | (1 << (p - 1))", setup_set))
        cases.append(Case("bitset", f"{cls}, clear", f"bitset/onInteger/{cls}/scalarBit/scalarValue/fresh",
                          "a & ~(1 << (p - 1))", setup_clear))

    def setup_double_set(n):
        a, mask = bitset_values(n, np.float64), np.uint64(bit)
        return lambda: (as_uint64(a) | mask).astype(np.float64)

    def setup_double_clear(n):
        a, mask = bitset_values(n, np.float64), ~np.uint64(bit)
        return lambda: (as_uint64(a) & mask).astype(np.float64)
    cases.append(Case("bitset", "double, set", "bitset/onDouble/double/scalarBit/noValue/fresh",
                      "(check(a) | (1 << (p - 1))).astype(f8)", setup_double_set))
    cases.append(Case("bitset", "double, clear", "bitset/onDouble/double/scalarBit/scalarValue/fresh",
                      "(check(a) & ~(1 << (p - 1))).astype(f8)", setup_double_clear))
    return cases


def bitshift_cases():
    cases = []
    for dtype in (np.uint8, np.uint64):
        cls, t = np.dtype(dtype).name, dtype
        for direction, ufunc, count in (("left", np.left_shift, 3), ("right", np.right_shift, -3)):
            def setup_scalar(n, dtype=dtype, t=t, ufunc=ufunc):
                a, count = wrapped_values(n, dtype), t(3)
                return lambda: ufunc(a, count)

            def setup_array(n, dtype=dtype, count=count):
                a, k = wrapped_values(n, dtype), np.full(n, count, dtype=np.int8)
                return lambda: shift_by_array(a, k)
            cases.append(Case("bitshift", f"{cls}, {direction} 3",
                              f"bitshift/onInteger/{cls}/scalarCount/{direction}/fresh",
                              f"{ufunc.__name__}(a, 3)", setup_scalar))
            cases.append(Case("bitshift", f"{cls}, {direction}, counts",
                              f"bitshift/onInteger/{cls}/countArray/{direction}/fresh",
                              f"{'left' if count > 0 else 'right'} by int8 array (sign picks)",
                              setup_array))
    for direction, ufunc in (("left", np.left_shift), ("right", np.right_shift)):
        def setup_double(n, ufunc=ufunc):
            a, count = (golden(n) % np.uint64(2**53)).astype(np.float64), np.uint64(3)
            return lambda: ufunc(as_uint64(a), count).astype(np.float64)
        cases.append(Case("bitshift", f"double, {direction} 3",
                          f"bitshift/onDouble/uint64/scalarCount/{direction}/fresh",
                          f"{ufunc.__name__}(check(a), 3).astype(f8)", setup_double))
    return cases


def all_cases():
    return logic_cases() + bitcmp_cases() + bitget_cases() + bitset_cases() + bitshift_cases()


# ----------------------------------------------------------------- timing

def time_numpy(call, min_time, repetitions):
    """Seconds per call: the median of `repetitions` batches of at least min_time."""
    call()  # untimed: repeated calls, not the first touch of memory

    def batch(calls):
        start = time.perf_counter()
        for _ in range(calls):
            call()
        return time.perf_counter() - start

    gc_was_enabled = gc.isenabled()
    gc.disable()
    try:
        calls, seconds = 1, batch(1)
        while seconds < min_time:
            calls = max(calls * 2, int(calls * 1.2 * min_time / max(seconds, 1e-9)))
            seconds = batch(calls)
        per_call = [seconds / calls] + [batch(calls) / calls for _ in range(repetitions - 1)]
    finally:
        if gc_was_enabled:
            gc.enable()
    return statistics.median(per_call)


def time_library(bench, case, counts, min_time, repetitions):
    """Seconds per call of the library's case at each count, and the report's context."""
    assert re.fullmatch(r"[\w/:-]+", case.library), case.library
    pattern = f"^{case.library}/n:({'|'.join(map(str, counts))})/"
    command = [bench, f"--benchmark_filter={pattern}", "--benchmark_format=json",
               f"--benchmark_min_time={min_time}", f"--benchmark_repetitions={repetitions}",
               "--benchmark_report_aggregates_only=true"]
    run = subprocess.run(command, capture_output=True, text=True, check=True)
    report = json.loads(run.stdout)
    seconds = {}
    for entry in report["benchmarks"]:
        if repetitions > 1 and entry.get("aggregate_name") != "median":
            continue
        n = int(re.search(r"/n:(\d+)", entry["run_name"]).group(1))
        unit = {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1.0}[entry["time_unit"]]
        seconds[n] = entry["real_time"] * unit
    missing = [n for n in counts if n not in seconds]
    if missing:
        sys.exit(f"bitfcns_bench has no case {case.library}/n:{missing[0]}")
    return seconds, report["context"]


# ------------------------------------------------------------ the machine

def cpu_name():
    try:
        for line in Path("/proc/cpuinfo").read_text().splitlines():
            if line.startswith("model name"):
                return line.split(":", 1)[1].strip()
    except OSError:
        pass
    return platform.processor() or "unknown"


def numpy_simd():
    """NumPy's baseline, its dispatched extensions and which of them this CPU has."""
    try:
        from numpy.core import _multiarray_umath as umath
    except ImportError:  # NumPy 2 moved the module
        from numpy._core import _multiarray_umath as umath
    features = umath.__cpu_features__
    dispatch = list(umath.__cpu_dispatch__)
    return (list(umath.__cpu_baseline__), [f for f in dispatch if features.get(f)],
            [f for f in dispatch if not features.get(f)])


def load_average():
    return " ".join(f"{x:.2f}" for x in os.getloadavg())


def header(bench_context, load_at_start):
    baseline, found, not_found = numpy_simd()
    lines = [
        f"CPU: {cpu_name()}, {os.cpu_count()} logical CPUs; "
        f"load average {load_at_start} at the start, {load_average()} at the end",
        f"NumPy {np.__version__} (Python {platform.python_version()}), one thread per ufunc call",
        f"NumPy SIMD: baseline {' '.join(baseline)}; dispatched and found {' '.join(found) or '-'}; "
        f"dispatched, not on this CPU {' '.join(not_found) or '-'}",
    ]
    standard = {"date", "host_name", "executable", "num_cpus", "mhz_per_cpu", "cpu_scaling_enabled",
                "caches", "load_avg", "library_build_type"}
    extra = {k: v for k, v in bench_context.items() if k not in standard}
    lines.append("bitfcns_bench context: " + (", ".join(f"{k}={v}" for k, v in extra.items()) or "-"))
    return lines


# --------------------------------------------------------------- reports

def count_label(n):
    mantissa, exponent = f"{n:.0e}".split("e")
    return f"{mantissa}e{int(exponent)}"


def format_seconds(s):
    if s < 1e-3:
        return f"{s * 1e6:.3g} us"
    if s < 1:
        return f"{s * 1e3:.3g} ms"
    return f"{s:.3g} s"


def cell(text):
    """Text for a Markdown table cell: a pipe, even in code, would end the cell."""
    return text.replace("|", "\\|")


def print_tables(cases, counts, library, numpy):
    columns = " | ".join(count_label(n) for n in counts)
    rule = "|---|---|" + "---:|" * len(counts)
    print("NumPy time / library time (above 1: the library is faster):\n")
    print(f"| library case | NumPy | {columns} |")
    print(rule)
    for case in cases:
        ratios = " | ".join(f"{numpy[case.library][n] / library[case.library][n]:.2f}" for n in counts)
        print(f"| {case.library} | `{cell(case.numpy)}` | {ratios} |")
    print("\nTime per call, library / NumPy:\n")
    print(f"| library case | NumPy | {columns} |")
    print(rule)
    for case in cases:
        times = " | ".join(f"{format_seconds(library[case.library][n])} / {format_seconds(numpy[case.library][n])}"
                           for n in counts)
        print(f"| {case.library} | `{cell(case.numpy)}` | {times} |")


def plot(cases, counts, library, numpy, title, path):
    figure, axes = plt.subplots(2, 4, figsize=(20, 13), constrained_layout=True)
    colours = plt.get_cmap("tab20").colors
    for panel, function in zip(axes.flat, FUNCTIONS):
        panel_cases = [c for c in cases if c.function == function]
        for index, case in enumerate(panel_cases):
            colour = colours[(2 * index) % 20]
            panel.plot(counts, [n / library[case.library][n] for n in counts], "-o", color=colour,
                       label=case.label)
            panel.plot(counts, [n / numpy[case.library][n] for n in counts], "--x", color=colour,
                       alpha=0.8)
        panel.set_xscale("log")
        panel.set_yscale("log")
        panel.set_title(function)
        panel.set_xlabel("elements")
        panel.set_ylabel("elements per second")
        panel.grid(True, which="both", alpha=0.3)
        if panel_cases:
            panel.legend(fontsize=8, ncol=2, loc="upper center", bbox_to_anchor=(0.5, -0.12))
    notes = axes.flat[len(FUNCTIONS)]
    notes.axis("off")
    notes.plot([], [], "-o", color="grey", label="bitfcns (result allocated per call)")
    notes.plot([], [], "--x", color="grey", label="NumPy (result allocated per call)")
    notes.legend(loc="upper left", fontsize=9)
    text = [textwrap.fill(line, 55, subsequent_indent="  ") for line in title]
    text.append("Doubles in NumPy: check, convert to uint64, operate, convert back.")
    notes.text(0, 0.85, "\n".join(text), va="top", fontsize=9, transform=notes.transAxes)
    figure.suptitle("bitfcns against NumPy: elements per second by element count (log-log)")
    path.parent.mkdir(parents=True, exist_ok=True)
    figure.savefig(path, dpi=80)
    plt.close(figure)


def main():
    here = Path(__file__).resolve().parent
    parser = argparse.ArgumentParser(description=__doc__.split("\n\n")[0])
    parser.add_argument("--quick", action="store_true",
                        help="counts 1e3 and 5e6, one short repetition: a smoke run")
    parser.add_argument("--bench", default=str(here.parent / "build/release/bench/bitfcns_bench"),
                        help="the library's benchmark program")
    parser.add_argument("--out", default=str(here / "figures"), help="where the plot goes")
    parser.add_argument("--repetitions", type=int, help="repetitions on both sides (default 5)")
    parser.add_argument("--min-time", type=float, help="seconds per repetition (default 0.1)")
    parser.add_argument("--filter", default="", help="only library cases matching this regex")
    args = parser.parse_args()
    counts = QUICK_COUNTS if args.quick else COUNTS
    repetitions = args.repetitions or (1 if args.quick else 5)
    min_time = args.min_time or (0.01 if args.quick else 0.1)
    if not os.access(args.bench, os.X_OK):
        sys.exit(f"no benchmark program at {args.bench}: build the target bitfcns_bench first")

    cases = [c for c in all_cases() if re.search(args.filter, c.library)]
    library, numpy, context = {}, {}, {}
    started, load_at_start = time.time(), load_average()
    for case in cases:
        # Each case both ways back to back, so that a change of load hits both.
        library[case.library], context = time_library(args.bench, case, counts, min_time, repetitions)
        numpy[case.library] = {}
        for n in counts:
            numpy[case.library][n] = time_numpy(case.setup(n), min_time, repetitions)
        print(f"  {case.library}: done", file=sys.stderr, flush=True)

    title = header(context, load_at_start)
    title.append(f"{repetitions} repetitions of at least {min_time} s, medians; "
                 f"{time.time() - started:.0f} s in all")
    print("\n".join(title) + "\n")
    print_tables(cases, counts, library, numpy)
    path = Path(args.out) / "compare_numpy.png"
    plot(cases, counts, library, numpy, title, path)
    print(f"\nplot: {path}")


if __name__ == "__main__":
    main()
