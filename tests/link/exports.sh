#!/bin/sh
# Usage: exports.sh LIBRARY MAP PUBLIC_HEADERS HASH_HEADER
# What the library exports, what its version script lists and what the headers declare are the same names.
set -eu

library=$1
map=$2
headers=$3
hash_header=$4

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

# Version names are symbols too; they are of type A.
nm -D --defined-only --format=posix "$library" | awk '$2 != "A" { sub(/@.*/, "", $1); print $1 }' |
  grep -v '^__\(asan\|ubsan\|odr_asan\|gcov\|llvm\|tsan\)' | sort -u >"$work/exported"

sed -n '/global:/,/local:/p' "$map" | sed -n 's/^ *\([A-Za-z_][A-Za-z0-9_]*\);.*/\1/p' | sort -u >"$work/listed"

# A declaration starts with HB_API; the name is the word in front of the first parenthesis, or the variable's.
cat "$headers"/*.h "$hash_header" | grep -v '^#' | tr '\n' ' ' |
  grep -oE '(extern )?HB_API [^;]*;' |
  sed -E 's/^(extern )?HB_API //; s/\(.*//; s/;.*//; s/.*[ *]([A-Za-z_][A-Za-z0-9_]*) *$/\1/' | sort -u >"$work/declared"

status=0
compare() {
  if ! diff "$work/$1" "$work/$2" >"$work/difference"; then
    echo "names that differ between those $1 (<) and those $2 (>):" >&2
    cat "$work/difference" >&2
    status=1
  fi
}

for list in exported listed declared; do
  [ -s "$work/$list" ] || { echo "no name is $list: $library, $map, $headers" >&2; exit 1; }
done
compare exported listed
compare listed declared
exit $status
