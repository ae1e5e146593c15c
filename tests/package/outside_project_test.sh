#!/bin/bash
# usage: outside_project_test.sh STAGING-FOLDER SANDBOX COMPILER cmake|pkg-config
#
# Builds the project in outside/, which knows nothing but the installed package, as C++17 with that compiler, and
# runs it against the installed library.
set -euo pipefail
staging=$(realpath "$1")
sandbox=$2
compiler=$3
way=$4
source=$(realpath "$(dirname "$0")")/outside
build=$(mktemp -d)
trap 'rm -rf "$build"' EXIT

libraries=$(dirname "$(find "$staging" -name libvelmor.so)")
prefix=$(dirname "$(find "$staging" -type d -name include)")
# An installed program finds the library by itself; a staged one has to be told.
run() { LD_LIBRARY_PATH=$libraries "$sandbox" "$@"; }

case $way in
  cmake)
    cmake -S "$source" -B "$build" -G Ninja -DCMAKE_CXX_COMPILER="$compiler" -DCMAKE_PREFIX_PATH="$prefix" >/dev/null
    cmake --build "$build"
    ;;
  pkg-config)
    export PKG_CONFIG_PATH=$libraries/pkgconfig
    read -ra flags < <(pkg-config --cflags --libs velmor)
    "$compiler" -std=c++17 -Wall -Wextra -Wpedantic -Werror "$source/main.cc" "${flags[@]}" -o "$build/outside"
    # The version is the library's own.
    [[ $(pkg-config --modversion velmor) == $(basename "$(realpath "$libraries/libvelmor.so")" | sed 's/.*\.so\.//') ]]
    ;;
esac
run "$build/outside"
