#!/usr/bin/env bash
# The command line of bitcalc: where statements come from, -k, --canonical,
# --check with its report, exit statuses and usage errors.
set -uo pipefail
bitcalc=${1:?usage: command_line_test.sh BITCALC}
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
failures=0
fail() { echo "FAIL $*"; failures=$((failures + 1)); }

# expect NAME STATUS EXPECTED_STDOUT -- COMMAND...
expect() {
  local name=$1 status=$2 expected=$3 actual code
  shift 4
  actual=$("$@" 2>"$scratch/stderr")
  code=$?
  [[ $code == "$status" && $actual == "$expected" ]] || fail "$name: status $code (wanted $status)
  stdout: $actual
  wanted: $expected
  stderr: $(<"$scratch/stderr")"
}
# Lost output and input that can't be read are errors, told on standard error.
stderr_says() { grep -q -- "$1" "$scratch/stderr" || fail "stderr lacks '$1'"; }

expect "-e canonical" 0 $'x = uint8 1x3 [1 2 255]\nans = double 1x1 [3]' -- \
  "$bitcalc" --canonical -e 'x = uint8([1 2 255]), 1 + 2'
expect "first error ends the run" 1 $'a = double 1x1 [1]\nerror: bitcalc:undefinedName' -- \
  "$bitcalc" --canonical -e $'a = 1\nb = nosuch\nc = 3'
expect "-k goes on" 1 $'error: bitcalc:undefinedName\nc = double 1x1 [3]' -- \
  "$bitcalc" --canonical -k -e $'b = nosuch\nc = 3'
expect "human display" 0 $'x = 1x3 uint8\n    1    2  255' -- "$bitcalc" -e 'x = uint8([1 2 255])'

printf 'y = 2 * 3\n' >"$scratch/statements.m"
expect "file" 0 'y = double 1x1 [6]' -- "$bitcalc" --canonical "$scratch/statements.m"
expect "standard input" 0 'y = double 1x1 [6]' -- bash -c "'$bitcalc' --canonical < '$scratch/statements.m'"
expect "missing file" 1 '' -- "$bitcalc" "$scratch/none.m"
expect "write error" 1 '' -- bash -c "'$bitcalc' --canonical -e 'x = 1:10' >/dev/full"
stderr_says "can't write the output"
expect "directory" 1 '' -- "$bitcalc" "$scratch"
stderr_says "Is a directory"
expect "--check directory" 1 '' -- "$bitcalc" --check "$scratch"
printf '%% no cases\n' >"$scratch/empty.case"
expect "--check without cases" 1 '' -- "$bitcalc" --check "$scratch/empty.case"
stderr_says "holds no cases"

printf '>> 1 + 1\nans = double 1x1 [2]\n\n>> x = 5\nx = double 1x1 [6]\n' >"$scratch/failing.case"
expect "--check reports the line" 1 \
  "$scratch/failing.case:4: >> x = 5
  expected: x = double 1x1 [6]
  actual:   x = double 1x1 [5]
$scratch/failing.case: 1 of 2 cases passed" -- "$bitcalc" --check "$scratch/failing.case"

help=$("$bitcalc" --help) && [[ $help == *--canonical* ]] || fail "--help fails or doesn't explain --canonical"
for usage in "--bogus" "-e" "-e 1 -e 2" "--check" "-e 1 file.m" "a.m b.m"; do
  # shellcheck disable=SC2086
  expect "usage: $usage" 2 '' -- "$bitcalc" $usage
done

((failures)) && { echo "$failures command line checks failed"; exit 1; }
echo "command line checks passed"
