#!/usr/bin/env bash
# Installs a build and moves the result, so that nothing can depend on where it was installed to.
#
# install.sh CMAKE BUILD_DIRECTORY TREE
set -euo pipefail

cmake=$1 build=$2 tree=$3

rm -rf "$tree" "$tree.first"
"$cmake" --install "$build" --prefix "$tree.first"
mv "$tree.first" "$tree"
