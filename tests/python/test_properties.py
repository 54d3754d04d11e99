# Properties against NumPy: AND, OR and XOR of every integer dtype over
# shapes that broadcast, in any number of dimensions. Element values of every
# class are the reference model's; here the shapes cross the module.
import numpy as np
from hypothesis import given, strategies as st
from hypothesis.extra import numpy as hnp

import bitfcns

INTEGER_DTYPES = ["int8", "uint8", "int16", "uint16", "int32", "uint32", "int64", "uint64"]


@st.composite
def broadcasting_pairs(draw):
    dtype = np.dtype(draw(st.sampled_from(INTEGER_DTYPES)))
    shapes = draw(hnp.mutually_broadcastable_shapes(num_shapes=2, max_dims=5, max_side=5))
    return tuple(draw(hnp.arrays(dtype, shape, elements=hnp.from_dtype(dtype))) for shape in shapes.input_shapes)


@given(broadcasting_pairs())
def test_and_or_xor_are_numpy_broadcasting(pair):
    a, b = pair
    for function, reference in [(bitfcns.bitand, np.bitwise_and), (bitfcns.bitor, np.bitwise_or),
                                (bitfcns.bitxor, np.bitwise_xor)]:
        result = function(a, b)
        expected = reference(a, b)
        assert result.dtype == a.dtype and result.shape == expected.shape
        np.testing.assert_array_equal(result, expected)
    np.testing.assert_array_equal(bitfcns.bitcmp(a), np.invert(a))
