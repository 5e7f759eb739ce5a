#!/usr/bin/env bash
# Every public header compiles from the installed tree, every exported name opens a page there, and no file there knows
# where it was built or first installed.
#
# installed_files_test.sh SOURCE_DIRECTORY BUILD_DIRECTORY
# shellcheck source=tests/interface/installed.sh
. "$(dirname "$0")/installed.sh"

sources=$1 build=$2

include=$TREE/include
headers=$(cd "$include" && find hb_client.h hb_client hb_protocol -name '*.h')
for header in $headers; do
  echo "#include <$header>" >"$work/alone.c"
  cp "$work/alone.c" "$work/alone.cpp"
  "$CC" -std=c11 -Wall -Wextra -Werror -fsyntax-only -I"$include" "$work/alone.c" || fail "$header is no C11"
  "$CXX" -std=c++20 -Wall -Wextra -Werror -fsyntax-only -I"$include" "$work/alone.cpp" || fail "$header is no C++20"
done
for header in hb_client.h hb_client/events.h hb_client/hash.h hb_protocol/requests.h; do
  [ -e "$include/$header" ] || fail "$header is not installed"
done

while read -r name; do
  page=$(find "$TREE" -path "*/man3/$name.3")
  [ -n "$page" ] || fail "$name(3) is not installed"
  target=$(sed -n 's/^\.so //p' "$page")
  if [ -n "$target" ]; then
    grep -q "^\.Nm $name\b" "$(dirname "$page")/../$target" || fail "$name(3) leads to $target, which is not about it"
  fi
done < <(sed -nE '/global:/,/local:/s/^ *([A-Za-z]\w*);/\1/p' "$sources/lib/hb_client.map")

for file in "$(package_directory)/hb_client.pc" "$(find "$TREE" -name hb_clientConfig.cmake)" \
  "$(find "$TREE" -name hb_clientTargets.cmake)"; do
  [ -e "$file" ] || fail "$file is not installed"
  if grep -nE "$build|$sources|$TREE" "$file"; then
    fail "$file names a directory of the build"
  fi
done
