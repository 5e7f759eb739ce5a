#!/usr/bin/env bash
# Builds an example against the installed tree, and runs it without a daemon and with one.
#
# example_test.sh pkg-config|cmake SOURCE SCENARIO EXPECTED_TEXT...
#
# The example is told to end after two events, which answer its two subscriptions: the nodes and the adapters.
# shellcheck source=tests/interface/installed.sh
. "$(dirname "$0")/installed.sh"

how=$1 source=$2 scenario=$3
shift 3
program=$work/$(basename "${source%.*}")

case $how in
  pkg-config) build_with_pkg_config "$source" "$program" ;;
  cmake) build_with_cmake "$(dirname "$source")" "$program" ;;
  *) fail "unknown way to build: $how" ;;
esac

name=$(basename "$program")
if HB_SERVER_SOCKET=$work/nobody "$program" 2 >"$work/output" 2>&1; then
  fail "$name succeeds without a daemon: $(cat "$work/output")"
fi
expect_line "$work/output" "$name: hb_init failed with error 15, see hb_get_errno(3)"
expect_line "$work/output" "$name: no daemon answers; start one with: hbd"

if [ -n "${HBD:-}" ]; then
  start_daemon "$scenario"
  timeout 30 "$program" 2 >"$work/output" || fail "$name fails beside hbd: $(cat "$work/output" "$work/hbd.log")"
  for text in "$@"; do
    expect_text "$work/output" "$text"
  done
fi
