#!/usr/bin/env bash
# Takes something away from a copy of the four places, or adds something, and expects the check to name the gap.
#
# interface_check_test.sh ROOT
set -euo pipefail

root=${1:?usage: interface_check_test.sh ROOT}
copy=$(mktemp -d)
trap 'rm -rf "$copy"' EXIT
failures=0

fresh_copy() {
  rm -rf "${copy:?}"/*
  mkdir -p "$copy/lib" "$copy/utils" "$copy/doc"
  cp -r "$root/include" "$root/tests" "$copy"
  cp "$root/lib/hb_client.map" "$copy/lib"
  cp "$root/utils/hash.h" "$copy/utils"
  cp -r "$root/doc/man" "$copy/doc"
}

expect_gap() {
  local gap=$1 output
  if output=$("$root/tests/interface/interface_check.sh" "$copy"); then
    echo "not noticed: $gap"
    failures=$((failures + 1))
  elif ! grep -qF "$gap" <<<"$output"; then
    echo "not named: $gap; the check said: $output"
    failures=$((failures + 1))
  fi
}

fresh_copy
sed -i '/^ *hb_subscribe;/d' "$copy/lib/hb_client.map"
expect_gap "hb_subscribe: declared in a public header, but lib/hb_client.map does not export it"

fresh_copy
sed -i 's/global:/global:\n    hb_invented;/' "$copy/lib/hb_client.map"
expect_gap "hb_invented: exported by lib/hb_client.map, but no public header declares it"

fresh_copy
sed -i '/^\.Nm hb_terminate/d' "$copy/doc/man/hb_init.3"
expect_gap "hb_terminate: has no manual page"

fresh_copy
sed -i 's/^\.Nm hb_terminate/.Nm hb_invented ,\n&/' "$copy/doc/man/hb_init.3"
expect_gap "hb_invented: has a manual page, but no public header declares it"

fresh_copy
echo 'HB_API Hb_Rc hb_invented(int number);' >>"$copy/include/hb_client/events.h"
expect_gap "hb_invented: is called by no test"

fresh_copy
find "$copy/tests" -type f -exec sed -i 's/\bhb_get_FFDC_id\b/hb_other/g' {} +
expect_gap "hb_get_FFDC_id: is called by no test"

[ "$failures" -eq 0 ]
