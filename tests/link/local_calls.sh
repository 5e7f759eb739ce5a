#!/bin/sh
# Usage: local_calls.sh LIBRARY MAP
# The library binds the calls of its own functions to itself: no relocation leads to an exported function by name.
set -eu

functions=$(sed -n 's/^ *\([A-Za-z_][A-Za-z_0-9]*\);$/\1/p' "$2" | grep -v '^IsVEX$')
relocations=$(readelf -rW "$1" | awk '{print $5}' | sed 's/@.*//')
status=0
for function in $functions; do
  if echo "$relocations" | grep -qx "$function"; then
    echo "$1 looks for $function by name, so that a program's function of that name would be called" >&2
    status=1
  fi
done
# Without any name in it the listing would show nothing.
echo "$relocations" | grep -qx IsVEX || { echo "no relocation of $1 was read" >&2; status=1; }
exit $status
