# shellcheck shell=bash
# What the tests of the installed tree share. The caller's environment says what to test with:
#   TREE  the installed tree       CMAKE  the cmake of the build       FLAGS  compiler options of the build
#   CC, CXX  its compilers         HBD    the installed daemon, empty when it is not built
set -euo pipefail

: "${TREE:?}" "${CMAKE:?}" "${CC:?}" "${CXX:?}"
unset HA_DOMAIN_NAME HA_SYSPAR_NAME

work=$(mktemp -d)
daemon=
trap finish EXIT

finish() {
  stop_daemon
  rm -rf "$work"
}

fail() {
  echo "$*"
  exit 1
}

package_directory() { dirname "$(find "$TREE" -name hb_client.pc)"; }

# Compiles one source with what pkg-config says.
build_with_pkg_config() {
  local source=$1 program=$2 language build_flags package_flags
  read -ra build_flags <<<"${FLAGS:-}"
  read -ra package_flags <<<"$(PKG_CONFIG_PATH=$(package_directory) pkg-config --cflags --libs hb_client)"
  case $source in
    *.c) language=("$CC" -std=c11) ;;
    *) language=("$CXX" -std=c++20) ;;
  esac
  "${language[@]}" -Wall -Wextra -Werror "${build_flags[@]}" -o "$program" "$source" "${package_flags[@]}" \
    -Wl,-rpath,"$(library_directory)"
}

library_directory() { dirname "$(find "$TREE" -name libhb_client.so)"; }

# Builds an example's directory against the installed CMake package.
build_with_cmake() {
  local directory=$1 program=$2
  "$CMAKE" -S "$directory" -B "$work/build" -G Ninja -DCMAKE_PREFIX_PATH="$TREE" --no-warn-unused-cli \
    -DCMAKE_C_COMPILER="$CC" -DCMAKE_CXX_COMPILER="$CXX" -DCMAKE_C_FLAGS="${FLAGS:-}" -DCMAKE_CXX_FLAGS="${FLAGS:-}" \
    >"$work/configure.log" || fail "configuring failed: $(cat "$work/configure.log")"
  "$CMAKE" --build "$work/build"
  cp "$work/build/$(basename "$directory")" "$program"
}

# Starts hbd with a scenario on a socket of its own and waits until it accepts clients.
start_daemon() {
  local scenario=$1 ready
  export HB_SERVER_SOCKET=$work/socket
  mkfifo "$work/ready"
  "$HBD" --socket "$HB_SERVER_SOCKET" --scenario "$scenario" --ready-fd 3 3>"$work/ready" 2>"$work/hbd.log" &
  daemon=$!
  read -r -N 1 ready <"$work/ready" || [ -n "$ready" ] || fail "hbd did not start: $(cat "$work/hbd.log")"
}

stop_daemon() {
  if [ -n "$daemon" ]; then
    kill "$daemon" 2>/dev/null || true
    wait "$daemon" || true
    daemon=
  fi
}

# Some line holds the text.
expect_text() {
  local file=$1 text=$2
  grep -qF "$text" "$file" || fail "expected \"$text\" in: $(cat "$file")"
}

expect_line() {
  local file=$1 line=$2
  grep -qxF "$line" "$file" || fail "expected the line \"$line\" in: $(cat "$file")"
}
