#!/bin/sh
# Usage: shared_addresses.sh LIBRARY
# Pairs of names that are one function have one address in the library.
set -eu

library=$1

address_of() {
  nm -D --defined-only "$library" | awk -v name="$1" '{ sub(/@.*/, "", $3) } $3 == name { print $1 }'
}

status=0
same() {
  first=$(address_of "$1")
  second=$(address_of "$2")
  if [ -z "$first" ] || [ "$first" != "$second" ]; then
    echo "$1 ($first) and $2 ($second) are not one function" >&2
    status=1
  fi
}

same hb_get_split_info hb_get_merge_info
same hb_free_split_info hb_free_merge_info
same hb_site_down hb_site_merge
exit $status
