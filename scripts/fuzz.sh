#!/usr/bin/env bash
# Builds the fuzz targets (preset fuzz: clang, libFuzzer, AddressSanitizer and
# UndefinedBehaviorSanitizer) and runs each one in turn from its committed
# seeds and a working corpus kept in build/fuzz/corpus/.
#
#   scripts/fuzz.sh [-t SECONDS] [TARGET...]   each target SECONDS long (default 600)
#   scripts/fuzz.sh --ci                       all targets, about 5 minutes together
#   scripts/fuzz.sh --save-seeds [TARGET...]   the working corpus, reduced to the inputs
#                                              that reach new edges, becomes the seeds
#
# Targets: bitand bitor bitxor bitcmp bitget bitset bitshift bitcalc (default: all).
# Seeds: tests/fuzz/corpus/TARGET.tar.gz (and tests/fuzz/calc_seeds/ for bitcalc).
# A fault leaves its input in build/fuzz/findings/TARGET/ and the log beside
# it, and the script fails. Per target it prints executions, edges (cov) and
# features (ft) reached.
set -euo pipefail
cd "$(dirname "$0")/.."

seconds=600
save=false
targets=()
while (($#)); do
  case $1 in
    --ci) seconds=35 ;;
    -t) seconds=${2:?-t needs seconds}; shift ;;
    --save-seeds) save=true ;;
    -h | --help) sed -n '2,15p' "$0"; exit 0 ;;
    *) targets+=("$1") ;;
  esac
  shift
done
((${#targets[@]})) || targets=(bitand bitor bitxor bitcmp bitget bitset bitshift bitcalc)

build=$(scripts/bootstrap.sh fuzz 2>&1) || { echo "$build" >&2; exit 1; }

status=0
for target in "${targets[@]}"; do
  program=build/fuzz/tests/fuzz/${target}_fuzz
  [[ -x $program ]] || { echo "fuzz.sh: no target $target" >&2; status=1; continue; }
  corpus=build/fuzz/corpus/$target
  archive=tests/fuzz/corpus/$target.tar.gz
  mkdir -p "$corpus"

  if $save; then
    reduced=$(mktemp -d)
    "$program" -merge=1 -use_counters=0 "$reduced" "$corpus" >/dev/null 2>&1
    tar --sort=name --owner=0 --group=0 --numeric-owner --mtime=@0 -C "$reduced" -cf - . |
      gzip -n9 >"$archive"
    echo "$target: $(find "$reduced" -type f | wc -l) seeds in $archive"
    rm -rf "$reduced"
    continue
  fi

  seeds=build/fuzz/seeds/$target
  rm -rf "$seeds" && mkdir -p "$seeds"
  [[ -f $archive ]] && tar -xzf "$archive" -C "$seeds"
  options=()
  if [[ $target == bitcalc ]]; then
    options+=(-dict=tests/fuzz/calc.dict tests/fuzz/calc_seeds)
  fi
  findings=build/fuzz/findings/$target
  mkdir -p "$findings"
  log=$findings.log
  if ! "$program" -max_total_time="$seconds" -timeout=30 -rss_limit_mb=3072 -print_final_stats=1 \
    -artifact_prefix="$findings/" "$corpus" "$seeds" "${options[@]}" >"$log" 2>&1; then
    echo "fuzz.sh: $target found a fault, see $log and $findings/" >&2
    status=1
  fi
  runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log")
  coverage=$(grep -oE 'cov: [0-9]+ ft: [0-9]+' "$log" | tail -1)
  printf '%-9s %10s executions  %s\n' "$target" "${runs:-?}" "${coverage:-}"
done
exit "$status"
