# Shared pieces of the Python tests: the Hypothesis profiles, and a marker
# for tests of functions that the loaded libbitfcns.so may not define yet.
import os

import hypothesis
import pytest

import bitfcns

hypothesis.settings.register_profile("default", max_examples=60, deadline=None, database=None)
# The sanitizer build runs every example some ten times slower.
hypothesis.settings.register_profile("sanitize", max_examples=15, deadline=None, database=None)
hypothesis.settings.load_profile(os.environ.get("BITFCNS_HYPOTHESIS_PROFILE", "default"))

INTEGER_DTYPES = ["int8", "uint8", "int16", "uint16", "int32", "uint32", "int64", "uint64"]


def pytest_configure(config):
    config.addinivalue_line("markers", "needs(*names): skip unless the library has these functions")
    # Debian's distributed on Debian's tornado.
    config.addinivalue_line("filterwarnings", "ignore:make_current is deprecated:DeprecationWarning")


def pytest_runtest_setup(item):
    for marker in item.iter_markers("needs"):
        missing = set(marker.args) - set(bitfcns.available_functions())
        if missing:
            pytest.skip(f"libbitfcns.so doesn't define {', '.join(sorted(missing))} yet")
