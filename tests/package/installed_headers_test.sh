#!/bin/bash
# usage: installed_headers_test.sh STAGING-FOLDER
#
# Compiles each installed header alone, as C++17 with both compilers; those for plug-ins also as C11.
set -euo pipefail
include=$(dirname "$(find "$1" -type d -path '*/include/authentication')")
strict=(-fsyntax-only -Wall -Wextra -Wpedantic -Werror "-I$include")
status=0

compile() {
  "$@" "${strict[@]}" - <<<"#include \"$header\"" || {
    echo "$header does not compile alone with: $*" >&2
    status=1
  }
}

count=0
while IFS= read -r header; do
  count=$((count + 1))
  compile g++ -std=c++17 -xc++
  compile clang++ -std=c++17 -xc++
  if [[ $header == authentication/plugin/* ]]; then
    compile gcc -std=c11 -xc
    compile clang -std=c11 -xc
  fi
done < <(cd "$include" && find . -name '*.h' -printf '%P\n' | sort)

if [[ $count -eq 0 ]]; then
  echo "no header is installed under $include" >&2
  status=1
fi
echo "$count headers"
exit $status
