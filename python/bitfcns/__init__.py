"""Element-wise bit functions over NumPy arrays.

The seven functions of libbitfcns.so -- ``bitand``, ``bitor``, ``bitxor``,
``bitcmp``, ``bitget``, ``bitset``, ``bitshift`` -- with the library's exact
rules of classes, sizes and refusals. Arrays are handed to the library
without copies where their layout allows it and results come back as NumPy
arrays over the library's storage; the GIL is released while the library
runs. ``bitfcns.dask`` runs the same functions chunk by chunk on Dask arrays.

A C-ordered array reaches the library with its shape reversed, the same
memory read column-major, so that the library's implicit expansion is
NumPy broadcasting and results have the shapes NumPy would give.
"""

from ._errors import BitfcnsError
from ._core import (
    available_functions,
    bitand,
    bitcmp,
    bitget,
    bitor,
    bitset,
    bitshift,
    bitxor,
)

__all__ = [
    "BitfcnsError",
    "available_functions",
    "bitand",
    "bitor",
    "bitxor",
    "bitcmp",
    "bitget",
    "bitset",
    "bitshift",
]
