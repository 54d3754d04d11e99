"""The seven bit functions on Dask arrays, lazily and chunk by chunk.

Each function takes the operands of its namesake in ``bitfcns`` -- Dask
arrays, NumPy arrays (made Dask arrays) and scalars or a type name (passed
to every chunk as they are) -- and returns a Dask array with the right
dtype and meta, without computing anything.

Chunks are aligned the way NumPy broadcasting aligns arrays. That is the
implicit expansion of ``bitand``, ``bitor`` and ``bitxor``; ``bitget``,
``bitset`` and ``bitshift`` accept no more than a single element against an
array, or arrays of one shape, and their chunks then pair up element for
element.

A call is refused exactly as one call on the whole arrays would be:

- Refusals that depend on dtypes, shapes and the type name are raised at
  once, when the Dask array is made, by the library itself: it is called on
  small stand-ins of the operands, with the same types and dtypes, the same
  sizes where a size is 0 or 1 and equal sizes where sizes are equal, and
  values that pass every test. Scalars are stand-ins too, so that a bad
  scalar is reported after the bad values of an earlier operand.
- Refusals of values (a double that its type can't hold, a bit position or
  shift count out of range) are raised when the result is computed. The
  library tests all values of the first operand before any position or
  count, so the identifier is the one of the earliest operand with a bad
  element in any chunk, whichever chunk fails first. To know it, every chunk
  is computed before any chunk of the result is handed on: the chunks of a
  result are held until all have passed, as one call validates every element
  before it writes any.
"""

from __future__ import annotations

from typing import Any, Callable, Sequence

import dask
import dask.array as da
import numpy as np
from dask.base import tokenize
from dask.core import flatten
from dask.highlevelgraph import HighLevelGraph

import bitfcns

from ._errors import BitfcnsError

__all__ = ["bitand", "bitor", "bitxor", "bitcmp", "bitget", "bitset", "bitshift"]


def bitand(a: Any, b: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitand`` on Dask arrays, chunk by chunk.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.from_array(np.array([12, 10, 255], np.uint8), chunks=2)
    >>> bitfcns.dask.bitand(x, 10).compute()
    array([ 8, 10, 10], dtype=uint8)
    """
    return _apply(bitfcns.bitand, (a, b, assumed_type))


def bitor(a: Any, b: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitor`` on Dask arrays, chunk by chunk.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.arange(4, chunks=2).astype(np.uint8)
    >>> bitfcns.dask.bitor(x, x[::-1]).compute()
    array([3, 3, 3, 3], dtype=uint8)
    """
    return _apply(bitfcns.bitor, (a, b, assumed_type))


def bitxor(a: Any, b: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitxor`` on Dask arrays, chunk by chunk, with broadcasting.

    Examples
    --------
    >>> import dask.array as da
    >>> rows = da.from_array(np.array([[1], [2]], np.int8))
    >>> bitfcns.dask.bitxor(rows, np.array([1, 3], np.int8)).compute()
    array([[0, 2],
           [3, 1]], dtype=int8)
    """
    return _apply(bitfcns.bitxor, (a, b, assumed_type))


def bitcmp(a: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitcmp`` on Dask arrays, chunk by chunk.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.from_array(np.array([0.0, 5.0, 255.0]), chunks=1)
    >>> bitfcns.dask.bitcmp(x, 'uint8').compute()
    array([255., 250.,   0.])
    >>> y = bitfcns.dask.bitcmp(da.from_array(np.array([1.0, -1.0]), chunks=1))
    >>> y.compute()
    Traceback (most recent call last):
        ...
    bitfcns.BitfcnsError: ... (VESPRA:bitcmp:outOfRange)
    """
    return _apply(bitfcns.bitcmp, (a, assumed_type))


def bitget(a: Any, position: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitget`` on Dask arrays, chunk by chunk.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.from_array(np.array([5, 6, 7], np.uint8), chunks=2)
    >>> bitfcns.dask.bitget(x, 1).compute()
    array([1, 0, 1], dtype=uint8)
    """
    return _apply(bitfcns.bitget, (a, position, assumed_type))


def bitset(
    a: Any, position: Any, value: Any = None, assumed_type: str | None = None, /
) -> da.Array:
    """``bitfcns.bitset`` on Dask arrays, chunk by chunk.

    As there, a third operand that is a str is the assumed type.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.from_array(np.array([0, 1, 2], np.uint8), chunks=2)
    >>> bitfcns.dask.bitset(x, 8).compute()
    array([128, 129, 130], dtype=uint8)
    """
    return _apply(bitfcns.bitset, (a, position, value, assumed_type))


def bitshift(a: Any, count: Any, assumed_type: str | None = None, /) -> da.Array:
    """``bitfcns.bitshift`` on Dask arrays, chunk by chunk.

    Examples
    --------
    >>> import dask.array as da
    >>> x = da.from_array(np.array([1, 2, 255], np.uint8), chunks=2)
    >>> bitfcns.dask.bitshift(x, -1).compute()
    array([  0,   1, 127], dtype=uint8)
    """
    return _apply(bitfcns.bitshift, (a, count, assumed_type))


# --- one chunk ---------------------------------------------------------------


class _Outcome:
    """What the call on one chunk gave: its result, or the refusal."""

    __slots__ = ("result", "fault")

    def __init__(self, result: np.ndarray | None, fault: tuple | None) -> None:
        self.result = result
        self.fault = fault


def _fault_rank(identifier: str | None) -> int:
    """The order in which a whole call reports value faults: the values of
    the first operands (outOfRange, outOfRangeMixedType) before positions and
    counts. Any other refusal can't depend on a chunk and goes first."""
    leaf = (identifier or "").rsplit(":", 1)[-1]
    if leaf in ("outOfRange", "outOfRangeMixedType"):
        return 1
    if leaf in ("BITOutOfRange", "inputsMustBeIntegers"):
        return 2
    return 0


def _call_chunk(function: Callable, *operands: Any) -> _Outcome:
    try:
        return _Outcome(function(*operands), None)
    except BitfcnsError as error:
        return _Outcome(None, (_fault_rank(error.identifier), error.message, error.identifier))


def _fault_of(outcome: _Outcome) -> tuple | None:
    return outcome.fault


def _verdict(*faults: tuple | None) -> None:
    """Raises the refusal that one call on the whole arrays would raise."""
    found = [fault for fault in faults if fault is not None]
    if found:
        _, message, identifier = min(found, key=lambda fault: fault[0])
        raise BitfcnsError(message, identifier)


def _result_of(outcome: _Outcome, verdict: None) -> np.ndarray:
    assert outcome.result is not None  # the verdict has passed every chunk
    return outcome.result


# --- the whole call ----------------------------------------------------------


def _apply(function: Callable, given: Sequence[Any]) -> da.Array:
    operands = [operand for operand in given if operand is not None]
    operands = [
        da.asarray(operand) if isinstance(operand, np.ndarray) and operand.ndim > 0 else operand
        for operand in operands
    ]
    arrays = [operand for operand in operands if isinstance(operand, da.Array)]
    for array in arrays:
        if any(np.isnan(size) for size in array.shape):
            raise ValueError(
                f"{function.__name__}: an operand has unknown chunk sizes; "
                "call compute_chunk_sizes() on it first"
            )

    # Refusals of dtypes, shapes and type names, and the result's dtype.
    sample = function(*_stand_ins(operands))
    ndim = max((np.ndim(operand) for operand in operands if not isinstance(operand, str)),
               default=0)
    meta = np.empty((0,) * ndim, dtype=sample.dtype)
    if not arrays:
        return da.from_delayed(
            dask.delayed(function, pure=True)(*operands), shape=(), dtype=sample.dtype, meta=meta
        )

    token = tokenize(function.__name__, *operands)
    name = function.__name__
    pairs: list[Any] = []
    for operand in operands:
        if isinstance(operand, da.Array):
            pairs += [operand, tuple(range(ndim - operand.ndim, ndim))]
        else:
            pairs += [operand, None]
    outcomes = da.blockwise(
        _call_chunk, tuple(range(ndim)), function, None, *pairs,
        name=f"{name}-chunk-{token}", dtype=sample.dtype, meta=meta,
    )
    return _released_after_verdict(outcomes, f"{name}-{token}", meta)


def _released_after_verdict(outcomes: da.Array, name: str, meta: np.ndarray) -> da.Array:
    """The result chunks of ``outcomes``, handed on once no chunk is refused."""
    keys = list(flatten(outcomes.__dask_keys__()))
    fault_name, verdict_key = f"{name}-fault", (f"{name}-verdict", 0)
    layer: dict[Any, Any] = {}
    for key in keys:
        layer[(fault_name, *key[1:])] = (_fault_of, key)
    layer[verdict_key] = (_verdict, *[(fault_name, *key[1:]) for key in keys])
    for key in keys:
        layer[(name, *key[1:])] = (_result_of, key, verdict_key)
    graph = HighLevelGraph.from_collections(name, layer, dependencies=[outcomes])
    return da.Array(graph, name, outcomes.chunks, meta=meta)


def _stand_ins(operands: Sequence[Any]) -> list[Any]:
    """Operands that the library treats as it treats ``operands`` up to the
    values, which all pass every test: ones of the same type or dtype, and for
    each array ones whose sizes keep 0 and 1 and map the other sizes met in
    one dimension (counted from the last, as NumPy broadcasting aligns them)
    to 2, 3, ... in order. A type name stays as it is."""
    arrays = [operand for operand in operands if isinstance(operand, da.Array)]
    ndim = max((array.ndim for array in arrays), default=0)
    small_sizes = []
    for axis in range(1, ndim + 1):
        met = sorted({a.shape[-axis] for a in arrays if a.ndim >= axis} - {0, 1})
        small_sizes.append({size: 2 + rank for rank, size in enumerate(met)})
    stand_ins: list[Any] = []
    for operand in operands:
        if isinstance(operand, da.Array):
            shape = tuple(
                small_sizes[operand.ndim - 1 - i].get(size, size)
                for i, size in enumerate(operand.shape)
            )
            stand_ins.append(np.ones(shape, dtype=operand.dtype))
        elif isinstance(operand, (np.ndarray, np.generic)):
            stand_ins.append(np.ones_like(operand))
        elif isinstance(operand, (bool, int, float)):
            stand_ins.append(type(operand)(1))
        else:
            stand_ins.append(operand)  # a type name, or what the library refuses
    return stand_ins
