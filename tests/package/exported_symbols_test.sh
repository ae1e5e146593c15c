#!/bin/bash
# usage: exported_symbols_test.sh LIBRARY [--update]
#
# Compares what the library exports with the list in exported_symbols.txt. What is missing from it breaks programs
# that are built already; what is new has to be kept for as long as the library has its name. With --update the
# list is written anew.
set -euo pipefail
library=$1
here=$(dirname "$0")
list=$here/exported_symbols.txt

if [[ ${2-} == --update ]]; then
  "$here/exported_symbols.sh" "$library" >"$list"
  exit 0
fi

status=0
if ! diff --unified=0 "$list" <("$here/exported_symbols.sh" "$library"); then
  echo "the exports differ from $list; when that is meant: $0 $library --update" >&2
  status=1
fi
# A unique symbol would keep the library loaded for ever.
if nm -D --defined-only "$library" | grep ' u '; then
  echo "these symbols are unique in the process" >&2
  status=1
fi
if readelf --dynamic "$library" | grep -E 'NODELETE|TEXTREL'; then
  echo "the library cannot be unloaded, or is changed when it is loaded" >&2
  status=1
fi
# Not safe on several threads, or a way to run a shell.
if nm -D --undefined-only "$library" | grep -E ' (strerror|strtok|localtime|gmtime|system|popen|tmpnam)(@|$)'; then
  echo "the library must not call these" >&2
  status=1
fi
soname=$(readelf --dynamic "$library" | sed -n 's/.*Library soname: \[\(.*\)\]/\1/p')
if [[ $soname != libvelmor.so.1 ]]; then
  echo "the library calls itself '$soname'" >&2
  status=1
fi
exit $status
