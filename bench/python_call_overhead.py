#!/usr/bin/python3
"""Overhead of a call from Python on top of the library call, at 1e3 elements.

For each case the same operands are timed two ways, alternately, in repeated
rounds:

- from Python: ``bitfcns.<name>(*operands)`` in a loop, less the time of the
  same loop calling a function that does nothing, timed with
  time.perf_counter_ns;
- the library alone: the entry point called in C++ on the same operands,
  made into host arrays once, with the GIL released
  (``bitfcns._core._library_call_ns``): what a host pays per call, the
  making and freeing of the result included.

The overhead is the difference: reading the arguments, making host arrays
over the NumPy buffers, releasing and taking back the GIL, and wrapping the
result as a NumPy array. A NumPy ufunc call on the same operands is shown for
scale. Medians over the rounds.

Run after building the release preset:

    PYTHONPATH=build/release/python /usr/bin/python3 bench/python_call_overhead.py
"""

import argparse
import statistics
import time

import numpy as np

import bitfcns
from bitfcns import _core

COUNT = 1000


def cases():
    rng = np.random.default_rng(0)
    bytes_a = rng.integers(0, 256, COUNT, dtype=np.uint8)
    bytes_b = rng.integers(0, 256, COUNT, dtype=np.uint8)
    doubles = rng.integers(0, 2**40, COUNT).astype(np.float64)
    yield "bitand", (bytes_a, bytes_b), "uint8, uint8", lambda: np.bitwise_and(bytes_a, bytes_b)
    yield "bitxor", (bytes_a, 3.0), "uint8, double scalar", lambda: np.bitwise_xor(bytes_a, 3)
    yield "bitand", (doubles, doubles), "double, double", None
    yield "bitcmp", (bytes_a,), "uint8", lambda: np.invert(bytes_a)
    yield "bitcmp", (doubles,), "double", None
    yield "bitget", (bytes_a, 3.0), "uint8, position 3", None
    yield "bitset", (bytes_a, 3.0), "uint8, position 3", None
    yield "bitshift", (bytes_a, 3.0), "uint8, count 3", lambda: np.left_shift(bytes_a, 3)


def per_call_ns(call, calls):
    loop = range(calls)
    start = time.perf_counter_ns()
    for _ in loop:
        call()
    return (time.perf_counter_ns() - start) / calls


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("--rounds", type=int, default=7)
    parser.add_argument("--calls", type=int, default=100_000)
    options = parser.parse_args()

    available = set(bitfcns.available_functions())
    print(f"| function | operands ({COUNT} elements) | from Python, ns | library, ns "
          f"| overhead, ns | NumPy ufunc, ns |")
    print("|---|---|---:|---:|---:|---:|")
    for name, operands, described, ufunc in cases():
        if name not in available:
            continue
        function = getattr(bitfcns, name)
        python, library, numpy = [], [], []
        for _ in range(options.rounds):
            loop = per_call_ns(lambda: None, options.calls)
            python.append(per_call_ns(lambda: function(*operands), options.calls) - loop)
            library.append(_core._library_call_ns(name, operands, options.calls))
            if ufunc:
                numpy.append(per_call_ns(ufunc, options.calls) - loop)
        python_ns, library_ns = statistics.median(python), statistics.median(library)
        numpy_text = f"{statistics.median(numpy):.0f}" if numpy else "-"
        print(f"| {name} | {described} | {python_ns:.0f} | {library_ns:.0f} "
              f"| {python_ns - library_ns:.0f} | {numpy_text} |")


if __name__ == "__main__":
    main()
