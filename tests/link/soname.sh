#!/bin/sh
# Usage: soname.sh LIBRARY
set -eu

soname=$(readelf -d "$1" | sed -n 's/.*(SONAME).*\[\(.*\)\]/\1/p')
if [ "$soname" != libhb_client.so.1 ]; then
  echo "the soname of $1 is '$soname', not libhb_client.so.1" >&2
  exit 1
fi
