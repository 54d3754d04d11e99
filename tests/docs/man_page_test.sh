#!/usr/bin/env bash
# Every option that bitcalc --help lists is described in the man page.
set -euo pipefail
bitcalc=${1:?usage: man_page_test.sh BITCALC MAN_PAGE}
page=$(sed 's/\\-/-/g' "${2:?usage: man_page_test.sh BITCALC MAN_PAGE}")
missing=0
options=$("$bitcalc" --help | sed -n '/^Options:/,/^$/p' | grep -oE -- '(^| )(-[a-z]|--[a-z-]+)' | sort -u)
for option in $options; do
  grep -qE -- "(^|[^a-z-])$option([^a-z-]|$)" <<<"$page" ||
    { echo "the man page doesn't describe $option"; missing=1; }
done
exit $missing
