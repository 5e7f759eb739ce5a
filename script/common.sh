# shellcheck shell=bash
# What the scripts share. Source it from a script in this directory, which then runs at the top of the project.
set -euo pipefail

script=$(realpath "$0")
cd "$(dirname "${BASH_SOURCE[0]}")/.."

say() { printf '%s\n' "$*" >&2; }

die() {
  say "script/$(basename "$script"): $*"
  exit 1
}

# Prints the comment at the head of the calling script, which is its help.
usage() { sed -n '2,/^[^#]/{/^# shellcheck/d;/^#/s/^# \{0,1\}//p}' "$script"; }

# Configures a preset, with a compiler cache when there is one. More arguments are handed to cmake.
configure_build() {
  local preset=$1 launcher=()
  shift
  if command -v ccache >/dev/null; then
    launcher=(-DCMAKE_C_COMPILER_LAUNCHER=ccache -DCMAKE_CXX_COMPILER_LAUNCHER=ccache)
  fi
  cmake --preset "$preset" "${launcher[@]}" "$@" >/dev/null
}

# Configures and builds a preset. More arguments are handed to the build.
build_preset() {
  local preset=$1
  shift
  configure_build "$preset"
  cmake --build --preset "$preset" "$@"
}

# The project's sources of the kinds named, for instance: sources cpp h
sources() {
  local kinds=() kind
  for kind in "$@"; do
    kinds+=(-o -name "*.$kind")
  done
  find include protocol lib utils platform daemon tools tests fuzz bench examples -type f \( "${kinds[@]:1}" \) | sort
}
