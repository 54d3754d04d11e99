#!/usr/bin/env bash
# Fails when the shared library exports any symbol of its own beyond the
# seven entry points and the version query.
set -euo pipefail
lib=${1:?usage: check_exports.sh LIBRARY}
symbols=$(nm -DC --defined-only "$lib" | cut -d' ' -f3-)
extra=$(grep -vE '^(ondelBit(And|Or|Xor|Cmp|Get|Set|Shift)Fcn|bitfcnsVersion)\(' <<<"$symbols" || true)
if [[ -n $extra ]]; then
  echo "unexpected exports in $lib:" >&2
  echo "$extra" >&2
  exit 1
fi
echo "$lib exports the entry points and the version query ($(grep -c . <<<"$symbols") symbols), nothing else"
