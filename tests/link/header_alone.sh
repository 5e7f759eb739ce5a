#!/bin/sh
# Usage: header_alone.sh COMPILER c|c++ HEADER SOURCE_DIRECTORY
# Compiles a translation unit that includes nothing but the header, twice to see its guard.
set -eu

compiler=$1
language=$2
header=$3
source=$4

case $language in
  c) standard=c11 ;;
  *) standard=c++20 ;;
esac

printf '#include "%s"\n#include "%s"\nint unused_%s;\n' "$source/$header" "$source/$header" "$$" |
  "$compiler" -x "$language" "-std=$standard" -fsyntax-only -Wall -Wextra -Wconversion -Wshadow -Wpedantic -Werror \
    -I"$source/include" -I"$source/protocol" -I"$source/platform/include" -
