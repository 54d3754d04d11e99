// The docstrings of the seven functions, in NumPy's layout, with examples
// that the test suite runs as doctests (with numpy as np and bitfcns
// imported).
#pragma once

namespace bitfcns::python::docstrings {

inline constexpr const char* kBitand =
    R"doc(bitand(a, b[, assumed_type], /, *, overwrite_input=False)

Bit-wise AND of two operands, element by element, with NumPy broadcasting.

An integer operand fixes the class of the computation and of the result:
its partner is an array of the same integer dtype, or a scalar double (a
Python int or float, or a one-element float64 array) that the dtype holds.
Without an integer operand, float64 and bool operands stand for integers of
the assumed type (uint64 unless ``assumed_type`` names another); every
value must be a whole number that type holds, and the result is float64.
Two bool operands alone give a bool result.

Parameters
----------
a, b : numpy.ndarray, NumPy scalar, bool, int or float
    Operands of dtype bool, int8 to int64, uint8 to uint64 or float64.
    float32 is refused, with or without a partner. A Python int must have an
    exact double value.
assumed_type : str, optional
    The integer type that float64 and bool operands stand for: 'int8' to
    'int64', 'uint8' to 'uint64', in any letter case. With an integer
    operand it may only repeat that operand's dtype.
overwrite_input : bool, optional
    Accepted for symmetry with the other functions; bitand never reuses an
    operand's storage.

Returns
-------
numpy.ndarray
    The broadcast shape of ``a`` and ``b``; dtype as described above.

Raises
------
BitfcnsError
    A refusal of the library, with its identifier in ``.identifier``, such
    as 'VESPRA:Bitand:mixedClasses' or 'VESPRA:Bitand:outOfRange'.
TypeError
    An operand of a dtype or type that isn't accepted, or a wrong number of
    operands.

Examples
--------
>>> bitfcns.bitand(np.array([12, 10, 255], dtype=np.uint8), 10)
array([ 8, 10, 10], dtype=uint8)
>>> bitfcns.bitand(np.array([[1], [3]], np.int8), np.array([1, 2, 3], np.int8))
array([[1, 0, 1],
       [1, 2, 3]], dtype=int8)
>>> bitfcns.bitand(12.0, 10)
array(8.)
>>> bitfcns.bitand(np.uint8(1), np.int8(1))
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: Inputs to bitand must be of the same integer class, ... (VESPRA:Bitand:mixedClasses)
)doc";

inline constexpr const char* kBitor = R"doc(bitor(a, b[, assumed_type], /, *, overwrite_input=False)

Bit-wise inclusive OR of two operands, element by element, with NumPy
broadcasting.

The rules of classes, sizes and the assumed type are those of ``bitand``;
identifiers are in the group 'VESPRA:Bitor'. On float64 operands the OR of
two values far apart may need more than the 53 bits of a double, and the
result is then the nearest double.

Parameters
----------
a, b : numpy.ndarray, NumPy scalar, bool, int or float
    As for ``bitand``.
assumed_type : str, optional
    As for ``bitand``.
overwrite_input : bool, optional
    Accepted for symmetry; bitor never reuses an operand's storage.

Returns
-------
numpy.ndarray

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:Bitor:sizeMismatch'.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitor(np.array([1, 2, 4], np.uint16), np.array([8], np.uint16))
array([ 9, 10, 12], dtype=uint16)
>>> bitfcns.bitor(np.array([300.0, 1.0]), 1.0, 'uint16')
array([301.,   1.])
>>> bitfcns.bitor(300.0, 1.0, 'uint8')
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: Double inputs of bitor must hold integers ... (VESPRA:Bitor:outOfRange)
)doc";

inline constexpr const char* kBitxor =
    R"doc(bitxor(a, b[, assumed_type], /, *, overwrite_input=False)

Bit-wise exclusive OR of two operands, element by element, with NumPy
broadcasting.

The rules of classes, sizes and the assumed type are those of ``bitand``;
identifiers are in the group 'VESPRA:bitxor' (lower case).

Parameters
----------
a, b : numpy.ndarray, NumPy scalar, bool, int or float
    As for ``bitand``.
assumed_type : str, optional
    As for ``bitand``.
overwrite_input : bool, optional
    Accepted for symmetry; bitxor never reuses an operand's storage.

Returns
-------
numpy.ndarray

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:bitxor:complexInputs'.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitxor(np.int8(-1), np.int8(5))
array(-6, dtype=int8)
>>> bitfcns.bitxor(np.array([True, False]), np.array([True, True]))
array([False,  True])
>>> bitfcns.bitxor(np.array([1.0, 2.0]), np.array([1, 2], np.uint8))
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: ... (VESPRA:bitxor:mixedClasses)
)doc";

inline constexpr const char* kBitcmp = R"doc(bitcmp(a[, assumed_type], /, *, overwrite_input=False)

Bit-wise complement of each element.

An integer array is complemented in its own dtype. A float64 array stands
for integers of the assumed type (uint64 unless ``assumed_type`` names
another): each value must be a whole number that type holds, and its
complement in that type comes back as float64 (rounded to the nearest
double for the 64-bit types).

Parameters
----------
a : numpy.ndarray, NumPy scalar, int or float
    Of dtype int8 to int64, uint8 to uint64 or float64. bool and float32
    are refused.
assumed_type : str, optional
    For float64: the integer type, 'int8' to 'uint64'. For an integer
    array: only its own dtype.
overwrite_input : bool, optional
    Let the result take over the storage of ``a`` when ``a`` is a writeable
    array that the result can replace element for element: then
    ``np.shares_memory(result, a)`` holds and ``a`` is overwritten.

Returns
-------
numpy.ndarray
    The shape of ``a``; its integer dtype, or float64.

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:bitcmp:outOfRange'.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitcmp(np.array([0, 5, 255], np.uint8))
array([255, 250,   0], dtype=uint8)
>>> bitfcns.bitcmp(5.0, 'uint8'), bitfcns.bitcmp(5, 'int8')
(array(250.), array(-6.))
>>> a = np.array([1, 2, 3], np.int16)
>>> r = bitfcns.bitcmp(a, overwrite_input=True)
>>> r, np.shares_memory(r, a)
(array([-2, -3, -4], dtype=int16), True)
>>> bitfcns.bitcmp(-1.0)
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: The input to bitcmp must hold integers ... (VESPRA:bitcmp:outOfRange)
)doc";

inline constexpr const char* kBitget =
    R"doc(bitget(a, position[, assumed_type], /, *, overwrite_input=False)

The bit at a 1-based position of each element: 1 for the least significant
bit.

For an integer ``a`` the result has its dtype and holds 0 or 1; positions
may be of any numeric dtype and must be whole numbers from 1 to the width
of the dtype. A float64 ``a`` stands for integers of the assumed type
(uint64 unless ``assumed_type`` names another) and the result is float64.
There is no broadcasting beyond a scalar: either operand may be a single
element, and otherwise the two must have the same shape.

Parameters
----------
a : numpy.ndarray, NumPy scalar, int or float
    Of dtype int8 to int64, uint8 to uint64 or float64.
position : numpy.ndarray, NumPy scalar, int or float
    Of any numeric dtype (float32 only with an integer ``a``).
assumed_type : str, optional
    As for ``bitcmp``.
overwrite_input : bool, optional
    Let the result take over the storage of a writeable array ``a`` of more
    than one element.

Returns
-------
numpy.ndarray

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:bitSetGet:BITOutOfRange'.
    Values are tested before positions.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitget(np.uint8(5), np.array([1, 2, 3], np.uint8))
array([1, 0, 1], dtype=uint8)
>>> bitfcns.bitget(np.array([-1.0, 64.0]), 7, 'int8')
array([1., 1.])
>>> bitfcns.bitget(np.uint8(5), 9)
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: ... (VESPRA:bitSetGet:BITOutOfRange)
)doc";

inline constexpr const char* kBitset =
    R"doc(bitset(a, position[, value][, assumed_type], /, *, overwrite_input=False)

A copy of ``a`` with the bit at a 1-based position set (or, with ``value``,
set where ``value`` is non-zero and cleared where it is zero).

With three operands the third is the assumed type when it is a str and
the value otherwise. For an integer ``a`` the result has its dtype; a
float64 ``a`` stands for integers of the assumed type (uint64 unless named)
and the result is float64. There is no broadcasting beyond a scalar: each
operand is a single element or has the shape of the others.

Parameters
----------
a : numpy.ndarray, NumPy scalar, int or float
    Of dtype int8 to int64, uint8 to uint64 or float64.
position : numpy.ndarray, NumPy scalar, int or float
    Of any numeric dtype (float32 only with an integer ``a``); whole numbers
    from 1 to the width of the type.
value : numpy.ndarray, NumPy scalar, bool, int or float, optional
    Non-zero sets the bit, zero clears it.
assumed_type : str, optional
    As for ``bitcmp``.
overwrite_input : bool, optional
    Let the result take over the storage of a writeable array ``a`` of more
    than one element.

Returns
-------
numpy.ndarray

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:bitset:outOfRange'. Values
    are tested before positions.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitset(np.array([0, 1, 2], np.uint8), 8)
array([128, 129, 130], dtype=uint8)
>>> bitfcns.bitset(np.uint8(255), 1, 0)
array(254, dtype=uint8)
>>> bitfcns.bitset(5.0, 8, 1, 'int8')
array(-123.)
>>> bitfcns.bitset(-1.0, 1)
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: ... (VESPRA:bitset:outOfRange)
)doc";

inline constexpr const char* kBitshift =
    R"doc(bitshift(a, count[, assumed_type], /, *, overwrite_input=False)

Each element shifted by a number of bits: left for a positive count, right
for a negative one.

Bits shifted past the top are lost, with no saturation; right shifts are
arithmetic for signed types and logical for unsigned ones. A count of the
width or more gives 0, a count of minus the width or less gives -1 for a
negative value and 0 otherwise. For an integer ``a`` the result has its
dtype; a float64 ``a`` stands for integers of the assumed type (uint64
unless named) and the result is float64. There is no broadcasting beyond a
scalar.

Parameters
----------
a : numpy.ndarray, NumPy scalar, int or float
    Of dtype int8 to int64, uint8 to uint64 or float64.
count : numpy.ndarray, NumPy scalar, int or float
    Of any numeric dtype (float32 only with an integer ``a``); finite whole
    numbers of any size.
assumed_type : str, optional
    As for ``bitcmp``.
overwrite_input : bool, optional
    Let the result take over the storage of a writeable array ``a`` of more
    than one element.

Returns
-------
numpy.ndarray

Raises
------
BitfcnsError
    A refusal of the library, such as 'VESPRA:bitshift:inputsMustBeIntegers'.
    Values are tested before counts.
TypeError
    An operand that isn't accepted, or a wrong number of operands.

Examples
--------
>>> bitfcns.bitshift(np.array([1, 2, 255], np.uint8), 1)
array([  2,   4, 254], dtype=uint8)
>>> bitfcns.bitshift(np.int8(-128), np.array([-7, -8, 1], np.int8))
array([-1, -1,  0], dtype=int8)
>>> bitfcns.bitshift(1, 63)
array(9.22337204e+18)
>>> bitfcns.bitshift(np.uint8(1), 1.5)
Traceback (most recent call last):
    ...
bitfcns.BitfcnsError: Shift counts must be finite integers. (VESPRA:bitshift:inputsMustBeIntegers)
)doc";

}  // namespace bitfcns::python::docstrings
