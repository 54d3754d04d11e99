#!/usr/bin/env bash
# Fails when a source file includes a header of a folder that its own folder
# may not depend on. Dependencies point one way:
#   host/      nothing of the library
#   frame/     host/
#   engine/    nothing (raw pointers, counts, functors)
#   include/   host/ (the entry points' declarations name the host's types)
#   calc/, python/                 host/ and include/ (the exported entry points)
#   every other folder: a function folder, which uses frame/, engine/ and
#                       include/, never host/ nor another function's folder
#   tests/, bench/             anything (not checked)
# An include is resolved as the compiler would: next to the including file,
# then from the project root, then from include/; what resolves to no file of
# the project is a system or third-party header and is not checked.
set -euo pipefail
cd "$(dirname "$0")/.."

allowed() {
  case $1 in
    host) echo "host" ;;
    frame) echo "frame host" ;;
    engine) echo "engine" ;;
    include) echo "include host" ;;
    calc | python) echo "$1 host include" ;;
    *) echo "$1 frame engine include" ;;
  esac
}

failures=0
while IFS= read -r file; do
  folder=${file%%/*}
  permitted=" $(allowed "$folder") "
  while IFS=: read -r line header; do
    target=
    for candidate in "$(dirname "$file")/$header" "$header" "include/$header"; do
      if [[ -f $candidate ]]; then
        target=$(realpath --relative-to=. "$candidate")
        break
      fi
    done
    [[ -n $target ]] || continue
    if [[ $permitted != *" ${target%%/*} "* ]]; then
      echo "$file:$line: $folder/ may not include $target" >&2
      failures=$((failures + 1))
    fi
  done < <(grep -nE '^[[:space:]]*#[[:space:]]*include[[:space:]]*["<]' "$file" |
    sed -E 's/^([0-9]+):[^"<]*["<]([^">]+)[">].*/\1:\2/')
done < <(find . -path ./build -prune -o -path ./tests -prune -o -path ./bench -prune -o \
  -path './.*' -prune -o -type f \( -name '*.hpp' -o -name '*.cpp' -o -name '*.h' -o -name '*.cc' \) \
  -printf '%P\n' | sort)

if ((failures)); then
  echo "check_includes.sh: $failures include(s) against the direction of dependencies" >&2
  exit 1
fi
echo "includes follow the direction of dependencies"
