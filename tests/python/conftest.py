# Shared pieces of the Python tests: the Hypothesis profiles.
import os

import hypothesis

hypothesis.settings.register_profile("default", max_examples=60, deadline=None, database=None)
# The sanitizer build runs every example some ten times slower.
hypothesis.settings.register_profile("sanitize", max_examples=15, deadline=None, database=None)
hypothesis.settings.load_profile(os.environ.get("BITFCNS_HYPOTHESIS_PROFILE", "default"))


def pytest_configure(config):
    # Debian's distributed on Debian's tornado.
    config.addinivalue_line("filterwarnings", "ignore:make_current is deprecated:DeprecationWarning")
