# The module's own work: operands and their conversions, layouts, storage in
# both directions, errors, threads, docstrings and stubs.
import doctest
import gc
import os
import pathlib
import subprocess
import sys
import threading
from concurrent.futures import ThreadPoolExecutor

import numpy as np
import pytest

import bitfcns
import bitfcns.dask


def identifier_of(call):
    with pytest.raises(bitfcns.BitfcnsError) as raised:
        call()
    return raised.value.identifier


def test_python_scalars_are_doubles_and_logicals():
    assert bitfcns.bitand(12, 10.0).dtype == np.float64
    assert bitfcns.bitand(True, np.array([True, False])).dtype == np.bool_
    assert bitfcns.bitand(np.uint8(200), 72).dtype == np.uint8  # integer with a double scalar
    assert bitfcns.bitand(2**53, 2**53).item() == 2**53
    assert bitfcns.bitand(-(2**63), -(2**63), "int64").item() == -(2**63)
    assert bitfcns.bitand(2**63, 2**63).item() == 2**63


@pytest.mark.parametrize(
    "operand, raised, message",
    [(2**53 + 1, ValueError, "no exact double"), (-(2**53) - 1, ValueError, "no exact double"),
     (10**400, ValueError, "no exact double"), ([1, 2], TypeError, "list"), (b"uint8", TypeError, "bytes"),
     (np.array([1], np.float16), TypeError, "float16"), (np.array([1], object), TypeError, "object"),
     (np.ma.masked_array([1], mask=[True]), TypeError, "masked array")],
)
def test_operands_without_a_host_class_are_python_errors(operand, raised, message):
    with pytest.raises(raised, match=message) as caught:
        bitfcns.bitand(np.uint8(1), operand)
    assert not isinstance(caught.value, bitfcns.BitfcnsError)
    assert raised is ValueError or ("argument 2" in str(caught.value) and "float64" in str(caught.value))


def layouts(base):
    swapped = base.astype(base.dtype.newbyteorder())
    unaligned = np.frombuffer(b"\0" + base.tobytes(), base.dtype, offset=1).reshape(base.shape)
    offset = np.empty(base.size + 1, base.dtype)  # lent one element past an aligned block
    offset[1:] = base.ravel()
    return {
        "fortran": np.asfortranarray(base),
        "strided": np.repeat(base, 2, axis=1)[:, ::2],
        "byteswapped": swapped,
        "unaligned": unaligned,
        "readonly": np.frombuffer(base.tobytes(), base.dtype).reshape(base.shape),
        "offset": offset[1:].reshape(base.shape),
    }


def test_overwrite_input_takes_over_a_writeable_c_ordered_operand_only():
    fresh = lambda: (np.arange(12, dtype=np.uint16) * 7919).reshape(3, 4)  # noqa: E731
    a = fresh()
    kept = bitfcns.bitcmp(a)
    assert not np.shares_memory(kept, a)
    np.testing.assert_array_equal(a, fresh())

    taken = bitfcns.bitcmp(a, overwrite_input=True)
    assert np.shares_memory(taken, a)
    np.testing.assert_array_equal(a, ~fresh())

    # Every layout reads as its C-ordered copy would, taken over or not.
    for name, other in layouts(fresh()).items():
        original = other.copy()
        result = bitfcns.bitcmp(other, overwrite_input=True)
        taken = name == "offset"  # the one layout lent as it is, and writeable
        assert np.shares_memory(result, other) == taken, name
        np.testing.assert_array_equal(other, ~original if taken else original)
        np.testing.assert_array_equal(result, ~original)


def test_an_operand_reading_the_first_shifted_keeps_it_from_being_taken_over():
    values = np.arange(40001, dtype=np.int32) % 7  # beyond the parallel limits
    expected = values[:-1] << values[1:]
    first = values[:-1]
    result = bitfcns.bitshift(first, values[1:], overwrite_input=True)
    assert not np.shares_memory(result, first)
    np.testing.assert_array_equal(result, expected)
    same = values.copy()
    result = bitfcns.bitshift(same, same, overwrite_input=True)  # each element read before written
    assert np.shares_memory(result, same)
    np.testing.assert_array_equal(result, values << values)


def test_results_and_operands_outlive_each_other():
    a = np.arange(100000, dtype=np.int64)
    references = sys.getrefcount(a)
    results = [bitfcns.bitcmp(a) for _ in range(50)]
    taken = bitfcns.bitcmp(a, overwrite_input=True)
    del results
    gc.collect()
    assert sys.getrefcount(a) == references + 1  # held by `taken` alone
    assert taken.flags.c_contiguous and taken.flags.writeable and taken.flags.aligned
    view = taken[10:20]
    del a, taken
    gc.collect()
    np.testing.assert_array_equal(view, ~np.arange(10, 20))


def test_refusals_carry_identifier_and_sentence_other_errors_are_python_ones():
    with pytest.raises(bitfcns.BitfcnsError) as raised:
        bitfcns.bitcmp(np.array([1.5]))
    error = raised.value
    assert isinstance(error, ValueError)
    assert error.identifier == "VESPRA:bitcmp:outOfRange"
    assert error.message == "The input to bitcmp must hold integers that the assumed integer class can hold."
    assert str(error) == f"{error.message} (VESPRA:bitcmp:outOfRange)"
    assert identifier_of(lambda: bitfcns.bitxor(np.uint8(1), 1.0, "uint16")) == "VESPRA:bitxor:invalidTypeString"
    assert identifier_of(lambda: bitfcns.bitand(np.array([1 + 2j]), 1.0)) == "VESPRA:Bitand:complexInputs"
    assert identifier_of(lambda: bitfcns.bitcmp(5.0, "\U0001f600")) is None  # the host's, without one
    with pytest.raises(TypeError, match=r"bitcmp\(\) takes 1 to 2 positional arguments but 3 were given"):
        bitfcns.bitcmp(1.0, "uint8", "uint8")
    with pytest.raises(TypeError, match="unexpected keyword argument 'overwrite'"):
        bitfcns.bitand(1.0, 1.0, overwrite=True)
    column = np.zeros((1 << 24, 1), np.uint8)
    with pytest.raises(MemoryError):  # an allocation failure
        bitfcns.bitand(column, column.T)  # 2**48 bytes


def test_calls_from_many_threads_at_once():
    rng = np.random.default_rng(7)
    work = [rng.integers(0, 2**63, 50000, dtype=np.uint64) for _ in range(8)]

    def run(values):
        for _ in range(30):
            assert np.array_equal(bitfcns.bitxor(values, values[::-1]), values ^ values[::-1])
            assert identifier_of(lambda: bitfcns.bitand(-1.0, values.astype(float))) == "VESPRA:Bitand:outOfRange"

    with ThreadPoolExecutor(len(work)) as pool:
        list(pool.map(run, work))  # raises what a thread raised


def test_the_gil_is_released_while_the_library_runs():
    # With no forced switches, this thread counts turns during the calls only
    # if the calls let go of the GIL.
    done = threading.Event()
    worker = threading.Thread(target=lambda: ([bitfcns.bitcmp(np.arange(1e6)) for _ in range(20)], done.set()))
    interval = sys.getswitchinterval()
    sys.setswitchinterval(100)
    try:
        worker.start()
        turns = 0
        while not done.wait(0.001):
            turns += 1
        worker.join()
    finally:
        sys.setswitchinterval(interval)
    assert turns > 0


DOCUMENTED = [bitfcns.BitfcnsError, bitfcns.available_functions] + [
    getattr(module, name) for name in bitfcns.__all__[2:] for module in (bitfcns, bitfcns.dask)]


@pytest.mark.parametrize("documented", DOCUMENTED, ids=lambda o: f"{o.__module__}.{o.__name__}")
def test_docstring_examples(documented):
    finder = doctest.DocTestFinder(recurse=False)
    runner = doctest.DocTestRunner(optionflags=doctest.ELLIPSIS | doctest.NORMALIZE_WHITESPACE)
    globs = {"np": np, "bitfcns": bitfcns}
    tests = finder.find(documented, documented.__name__, globs=globs)
    assert tests and tests[0].examples, "no examples"
    for test in tests:
        runner.run(test)
    assert runner.failures == 0


def test_stubs_match_the_extension(tmp_path):
    pytest.importorskip("mypy")
    checked = subprocess.run([sys.executable, "-m", "mypy.stubtest", "bitfcns._core"], cwd=tmp_path,
                             env={**os.environ, "MYPY_CACHE_DIR": str(tmp_path)}, capture_output=True, text=True)
    assert checked.returncode == 0, checked.stdout + checked.stderr
    assert pathlib.Path(bitfcns.__file__).with_name("py.typed").exists()
