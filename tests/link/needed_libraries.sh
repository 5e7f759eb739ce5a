#!/bin/sh
# Usage: needed_libraries.sh LIBRARY
# The library needs the language's runtime and the platform's four libraries, nothing else.
set -eu

status=0
needed=$(readelf -d "$1" | sed -n 's/.*(NEEDED).*\[\(.*\)\]/\1/p')
for library in $needed; do
  case $library in
    libstdc++.so.* | libgcc_s.so.* | libc.so.* | libm.so.* | ld-linux*.so.*) ;;
    libzu_tr.so.* | libzu_cu.so.* | libzu_mss.so.* | libzu_vex.so.*) ;;
    libasan.so.* | libubsan.so.* | libtsan.so.*) ;; # a build with sanitizers
    *)
      echo "$1 needs $library" >&2
      status=1
      ;;
  esac
done
[ -n "$needed" ] || { echo "$1 needs no library at all" >&2; status=1; }
exit $status
