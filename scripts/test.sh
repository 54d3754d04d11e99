#!/usr/bin/env bash
# Checks the direction of includes, builds the optimised, the sanitizer and
# the clang configurations, checks the library's exports, runs the whole
# test suite in all three, then the fuzz targets for about five minutes.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/check_includes.sh
scripts/bootstrap.sh release sanitize clang
scripts/check_exports.sh build/release/libbitfcns.so
for preset in release sanitize clang; do
  ctest --preset "$preset" -j "$(nproc)"
done
scripts/fuzz.sh --ci
