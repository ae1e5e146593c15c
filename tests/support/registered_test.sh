#!/bin/sh
# registered_test.sh TESTS-FOLDER BUILD-FOLDER: fails when a test source on disk is compiled by no target.
set -eu
tests=$1
commands=$2/compile_commands.json
missing=0
for file in $(find "$tests" -name '*.cc' -o -name '*.c' | sort); do
  case $file in
    "$tests"/package/*/*) continue ;; # sources of the outside projects, built by their own tests
  esac
  if ! grep -qF "\"file\": \"$file\"" "$commands"; then
    echo "not part of any target: $file" >&2
    missing=1
  fi
done
for file in $(find "$tests" -name '*_test.sh' -o -name '*_test.py' -o -name '*.bats' | sort); do
  if ! grep -rqF --include=CMakeLists.txt "$(basename "$file")" "$tests"; then
    echo "not registered as a test: $file" >&2
    missing=1
  fi
done
exit $missing
