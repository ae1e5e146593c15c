#!/bin/bash
# usage: exported_symbols.sh LIBRARY
#
# Prints what the library exports: one letter for the kind of each symbol and its name, demangled and sorted.
set -euo pipefail
nm -DC --defined-only --without-symbol-versions "$1" | cut -d ' ' -f 2- | grep -v '^A ' | LC_ALL=C sort -u
