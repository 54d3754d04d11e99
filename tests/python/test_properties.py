# Properties against NumPy and against plain-Python references: AND, OR,
# XOR and NOT over shapes that broadcast, the double path under an assumed
# type, shifts with their rule for large and negative counts, and the idioms
# of reading and setting one bit.
import numpy as np
import pytest
from hypothesis import given, strategies as st
from hypothesis.extra import numpy as hnp

import bitfcns
from conftest import INTEGER_DTYPES

integer_dtypes = st.sampled_from([np.dtype(name) for name in INTEGER_DTYPES])


def arrays_of(dtype, shape):
    return hnp.arrays(dtype, shape, elements=hnp.from_dtype(dtype))


@st.composite
def broadcasting_pairs(draw):
    dtype = draw(integer_dtypes)
    shapes = draw(hnp.mutually_broadcastable_shapes(num_shapes=2, max_dims=4, max_side=5))
    a, b = (draw(arrays_of(dtype, shape)) for shape in shapes.input_shapes)
    return a, b


@st.composite
def same_shape_pairs(draw, second_elements):
    """An integer array and a second operand of its shape or a scalar."""
    dtype = draw(integer_dtypes)
    shape = draw(hnp.array_shapes(min_dims=0, max_dims=3, min_side=0, max_side=5))
    a = draw(arrays_of(dtype, shape))
    second_shape = draw(st.sampled_from([shape, ()]))
    second = draw(hnp.arrays(np.int64, second_shape, elements=second_elements(dtype.itemsize * 8)))
    return a, second


def width_of(array):
    return array.dtype.itemsize * 8


def as_pattern(value, dtype):
    """A Python int cut to the bits of `dtype`, read back in its signedness."""
    width = dtype.itemsize * 8
    value &= (1 << width) - 1
    if dtype.kind == "i" and value >> (width - 1):
        value -= 1 << width
    return value


@given(broadcasting_pairs())
def test_and_or_xor_are_numpy_broadcasting(pair):
    a, b = pair
    for function, reference in [(bitfcns.bitand, np.bitwise_and), (bitfcns.bitor, np.bitwise_or),
                                (bitfcns.bitxor, np.bitwise_xor)]:
        result = function(a, b)
        expected = reference(a, b)
        assert result.dtype == a.dtype and result.shape == expected.shape
        np.testing.assert_array_equal(result, expected)


@given(integer_dtypes.flatmap(lambda dtype: arrays_of(dtype, hnp.array_shapes(min_dims=0, min_side=0))))
def test_not_is_numpy_invert(a):
    result = bitfcns.bitcmp(a)
    assert result.dtype == a.dtype and result.shape == a.shape
    np.testing.assert_array_equal(result, np.invert(a))


@given(integer_dtypes, st.data())
def test_doubles_stand_for_integers_of_the_assumed_type(dtype, data):
    info = np.iinfo(dtype)
    whole = st.integers(max(info.min, -(2**53)), min(info.max, 2**53)).map(float)
    x, y = (data.draw(hnp.arrays(np.float64, 4, elements=whole)) for _ in range(2))
    integers = x.astype(dtype), y.astype(dtype)
    np.testing.assert_array_equal(bitfcns.bitxor(x, y, dtype.name), (integers[0] ^ integers[1]).astype(float))
    np.testing.assert_array_equal(bitfcns.bitcmp(x, dtype.name.upper()), np.invert(integers[0]).astype(float))


def shift_rule(x, count, dtype):
    width = dtype.itemsize * 8
    if count >= width:
        return 0
    if count <= -width:
        return -1 if x < 0 else 0
    return as_pattern(x << count, dtype) if count >= 0 else x >> -count


@pytest.mark.needs("bitshift")
@given(same_shape_pairs(lambda width: st.one_of(st.integers(-2 * width, 2 * width),
                                                st.integers(-(2**62), 2**62))))
def test_shifts_follow_the_rule_for_any_count(pair):
    a, counts = pair
    expected = np.vectorize(lambda x, c: shift_rule(int(x), int(c), a.dtype), otypes=[a.dtype])(a, counts)
    # Clipped to int16 the large counts stay beyond the width: the same result.
    for count_operand in (counts, counts.astype(np.float64), counts.clip(-1000, 1000).astype(np.int16)):
        result = bitfcns.bitshift(a, count_operand)
        assert result.dtype == a.dtype
        np.testing.assert_array_equal(result, expected.reshape(result.shape))


@pytest.mark.needs("bitget")
@given(same_shape_pairs(lambda width: st.integers(1, width)))
def test_bit_read_is_shift_and_mask(pair):
    a, positions = pair
    expected = np.vectorize(lambda x, p: (int(x) >> (int(p) - 1)) & 1, otypes=[a.dtype])(a, positions)
    result = bitfcns.bitget(a, positions.astype(np.uint8))
    assert result.dtype == a.dtype
    np.testing.assert_array_equal(result, expected.reshape(result.shape))


@pytest.mark.needs("bitset")
@given(same_shape_pairs(lambda width: st.integers(1, width)), st.booleans())
def test_bit_set_is_or_and_clear_is_and_not(pair, value):
    a, positions = pair

    def reference(x, p):
        mask = 1 << (int(p) - 1)
        return as_pattern(int(x) | mask if value else int(x) & ~mask, a.dtype)

    expected = np.vectorize(reference, otypes=[a.dtype])(a, positions)
    result = bitfcns.bitset(a, positions, value)
    assert result.dtype == a.dtype
    np.testing.assert_array_equal(result, expected.reshape(result.shape))
