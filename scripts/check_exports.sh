#!/usr/bin/env bash
# Fails unless the shared library exports exactly the symbols of the list
# (default: cmake/exported_symbols.txt): one missing fails as one extra does.
set -euo pipefail
lib=${1:?usage: check_exports.sh LIBRARY [LIST]}
list=${2:-$(dirname "$0")/../cmake/exported_symbols.txt}
[[ -r $list ]] || { echo "check_exports.sh: no list $list" >&2; exit 2; }

export LC_ALL=C
expected=$({ grep -v -e '^#' -e '^[[:space:]]*$' "$list" || true; } | sort -u)
actual=$(nm -DC --defined-only "$lib" | cut -d' ' -f3- | sort -u)
missing=$(comm -23 <(echo "$expected") <(echo "$actual"))
extra=$(comm -13 <(echo "$expected") <(echo "$actual"))
if [[ -n $missing || -n $extra ]]; then
  [[ -z $missing ]] || printf '%s does not export:\n%s\n' "$lib" "$missing" >&2
  [[ -z $extra ]] || printf '%s exports beyond %s:\n%s\n' "$lib" "$list" "$extra" >&2
  exit 1
fi
echo "$lib exports the $(grep -c . <<<"$expected") symbols of $list and nothing else"
