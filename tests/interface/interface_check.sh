#!/usr/bin/env bash
# Compares what the library offers in its four places: public headers, export map, manual pages and tests.
#
# interface_check.sh ROOT [LIBRARY]
#
# Each name that a public header declares is exported, has a page and is used by a test; and nothing else is exported or
# documented. With a LIBRARY, what it exports is compared as well.
set -euo pipefail

root=${1:?usage: interface_check.sh ROOT [LIBRARY]}
library=${2:-}
gaps=0

# Functions and variables that the headers declare with HB_API, without comments and the macro's own definition.
declared() {
  cat "$root"/include/*.h "$root"/include/hb_client/*.h "$root"/utils/hash.h |
    sed -e 's|/\*.*\*/||g' -e '/^#/d' |
    sed -nE 's/^.*HB_API [^(;]*[ *]([A-Za-z_][A-Za-z_0-9]*)[(;].*$/\1/p' | sort -u
}

mapped() { sed -nE '/global:/,/local:/s/^[[:space:]]*([A-Za-z_][A-Za-z_0-9]*);.*$/\1/p' "$root/lib/hb_client.map" | sort -u; }

documented() {
  sed -n '/^\.Sh NAME/,/^\.Sh SYNOPSIS/s/^\.Nm \([A-Za-z_0-9]*\).*/\1/p' "$root"/doc/man/*.3 | sort -u
}

exported() { nm -D --defined-only "$library" | awk '$2 != "A" { sub(/@.*/, "", $3); print $3 }' | sort -u; }

# Names in the tests' sources outside comments and texts. A variable is used by its name, a function by a call.
used() {
  find "$root/tests" \( -name '*.cpp' -o -name '*.c' -o -name '*.h' \) -exec cat {} + |
    sed -e 's|//.*||' -e 's|"[^"]*"||g' |
    grep -oE '(^|[^A-Za-z_0-9])((hb|Hash|FindHashLoc|IndexHash|prime)[A-Za-z_0-9]*[[:space:]]*[(,);]|IsVEX)' |
    grep -oE '[A-Za-z_][A-Za-z_0-9]*' | sort -u
}

# Reports each name of the first list that the second one lacks.
report_missing() {
  local message=$1 name
  while read -r name; do
    printf '%s: %s\n' "$name" "$message"
    gaps=$((gaps + 1))
  done < <(comm -23 "$2" "$3")
}

lists=$(mktemp -d)
trap 'rm -rf "$lists"' EXIT
for list in declared mapped documented used; do
  $list >"$lists/$list"
done

report_missing "declared in a public header, but lib/hb_client.map does not export it" "$lists/declared" "$lists/mapped"
report_missing "exported by lib/hb_client.map, but no public header declares it" "$lists/mapped" "$lists/declared"
report_missing "has no manual page in doc/man" "$lists/declared" "$lists/documented"
report_missing "has a manual page, but no public header declares it" "$lists/documented" "$lists/declared"
report_missing "is called by no test" "$lists/declared" "$lists/used"
if [ -n "$library" ]; then
  exported >"$lists/exported"
  report_missing "declared, but $library does not export it" "$lists/declared" "$lists/exported"
  report_missing "exported by $library, but not declared" "$lists/exported" "$lists/declared"
fi

if [ ! -s "$lists/declared" ]; then
  echo "no public header declares anything: is $root the project's directory?"
  exit 1
fi
echo "$(wc -l <"$lists/declared") names, $gaps gaps"
[ "$gaps" -eq 0 ]
