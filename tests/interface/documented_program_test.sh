#!/usr/bin/env bash
# Builds the program that a document shows, and runs it without a daemon and with one that then stops.
#
# documented_program_test.sh DOCUMENT SCENARIO STATUS_AT_END MESSAGE_WITHOUT_DAEMON EXPECTED_LINE...
# shellcheck source=tests/interface/installed.sh
. "$(dirname "$0")/installed.sh"

document=$1 scenario=$2 status_at_end=$3 message=$4
shift 4

# The first block of C in a Markdown file, or the program of a manual page's EXAMPLES.
extract_program() {
  case $1 in
    *.md) awk '/^```c$/ { inside = 1; next } /^```$/ { if (inside) exit } inside' "$1" ;;
    *) awk '/^\.Sh EXAMPLES/ { section = 1 } section && /^\.Ed/ { exit } inside; section && /^\.Bd/ { inside = 1 }' "$1" |
      sed 's/\\e/\\/g' ;;
  esac
}

extract_program "$document" >"$work/program.c"
build_with_pkg_config "$work/program.c" "$work/program"

if HB_SERVER_SOCKET=$work/nobody "$work/program" >"$work/output" 2>&1; then
  fail "it succeeds without a daemon: $(cat "$work/output")"
fi
expect_line "$work/output" "$message"

if [ -n "${HBD:-}" ]; then
  start_daemon "$scenario"
  mkfifo "$work/lines"
  # Its output is a pipe, so it is told to write each line at once, by a library that comes before a sanitizer's.
  ASAN_OPTIONS=${ASAN_OPTIONS:-}:verify_asan_link_order=0 \
    timeout 30 stdbuf -oL "$work/program" >"$work/lines" 2>"$work/errors" &
  program=$!
  : >"$work/output"
  while read -r line; do
    echo "$line" >>"$work/output"
    # The last line that is expected has come: the daemon may go.
    if [ "$line" = "${*: -1}" ]; then
      stop_daemon
    fi
  done <"$work/lines"
  status=0
  wait "$program" || status=$?
  for line in "$@"; do
    expect_line "$work/output" "$line"
  done
  [ "$status" -eq "$status_at_end" ] ||
    fail "it ended with $status instead of $status_at_end: $(cat "$work/output" "$work/errors")"
fi
