#!/usr/bin/env bash
# Builds everything and runs bitcalc with the given arguments, or on an
# example when none are given.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/bootstrap.sh release >&2
if (($#)); then
  exec build/release/calc/bitcalc "$@"
fi
exec build/release/calc/bitcalc -k -e "x = uint8([1 2 255])
bitcmp(x)
bitand(12, 10)
bitxor(int8(-1), int8(5))"
