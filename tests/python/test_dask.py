# bitfcns.dask: the same results as one call on the whole arrays, lazily,
# with the right dtype and meta, whatever the chunks; refusals as one call on
# the whole arrays would raise them, whichever chunk fails first.
import dask
import dask.array as da
import numpy as np
import pytest

import bitfcns
import bitfcns.dask as bd
from bitfcns import BitfcnsError


def chunked(array, chunks):
    return da.from_array(array, chunks=chunks)


rng = np.random.default_rng(3)
bytes_2x9 = rng.integers(0, 256, (2, 9), dtype=np.uint8)
doubles_9 = rng.integers(0, 2**40, 9).astype(float)

CASES = [
    ("bitand", (chunked(bytes_2x9, (1, 4)), chunked(bytes_2x9[:1], (1, 3)))),
    ("bitor", (chunked(doubles_9, 2), 7.0)),
    ("bitxor", (chunked(bytes_2x9[:, :1], 1), bytes_2x9[0])),  # broadcast (2, 1) with (9,)
    ("bitcmp", (chunked(doubles_9, 4), "uint64")),
    ("bitget", (chunked(bytes_2x9, (2, 5)), chunked(bytes_2x9 % 8 + 1, (1, 3)))),
    ("bitset", (chunked(doubles_9, 3), 40, chunked(doubles_9 % 2, 4))),
    ("bitshift", (chunked(bytes_2x9, 3), np.array([[-3]], np.int8))),
]


@pytest.mark.parametrize("name, operands", CASES, ids=[case[0] for case in CASES])
def test_chunked_results_equal_one_whole_call(name, operands):
    result = getattr(bd, name)(*operands)
    whole = getattr(bitfcns, name)(*[op.compute() if isinstance(op, da.Array) else op for op in operands])
    assert result.dtype == whole.dtype and result._meta.dtype == whole.dtype
    assert result.shape == whole.shape and type(result._meta) is np.ndarray
    for scheduler in ("sync", "threads"):
        np.testing.assert_array_equal(result.compute(scheduler=scheduler), whole)


def test_nothing_is_computed_until_asked():
    calls = []

    def load():
        calls.append(1)
        return np.arange(4, dtype=np.uint8)

    lazy = da.from_delayed(dask.delayed(load)(), shape=(4,), dtype=np.uint8)
    result = bd.bitxor(bd.bitcmp(lazy), lazy)
    assert not calls
    np.testing.assert_array_equal(result.compute(), np.full(4, 255, np.uint8))


def test_refusals_of_classes_and_sizes_come_at_once():
    bytes_ = chunked(np.zeros(10, np.uint8), 3)
    with pytest.raises(BitfcnsError, match="mixedClasses"):
        bd.bitand(bytes_, chunked(np.zeros(10), 3))  # a double array isn't a scalar
    # A one-element double array is a scalar partner, in every chunk too.
    np.testing.assert_array_equal(bd.bitand(bytes_, np.ones((1, 1))).compute(), np.zeros((1, 10)))


@pytest.mark.parametrize("scheduler", ["sync", "threads"])
@pytest.mark.parametrize("counts", [chunked(np.r_[np.nan, np.ones(19)], 4), np.nan], ids=["first chunk", "scalar"])
def test_a_bad_value_in_the_last_chunk_wins_over_a_bad_count_in_the_first(scheduler, counts):
    values = np.arange(20.0)
    values[-1] = 0.5
    with pytest.raises(BitfcnsError) as raised:
        bd.bitshift(chunked(values, 4), counts).compute(scheduler=scheduler)
    assert raised.value.identifier == "VESPRA:bitshift:outOfRange"
