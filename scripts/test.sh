#!/usr/bin/env bash
# Builds the optimised and the sanitizer configurations and runs the whole
# test suite in both.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/bootstrap.sh release sanitize
scripts/check_exports.sh build/release/libbitfcns.so
for preset in release sanitize; do
  ctest --preset "$preset" -j "$(nproc)"
done
