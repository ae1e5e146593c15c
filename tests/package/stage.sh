#!/bin/bash
# usage: stage.sh BUILD-FOLDER STAGING-FOLDER
#
# Installs what a caller of the library gets into a new staging folder.
set -euo pipefail
rm -rf "$2"
for component in runtime development; do
  DESTDIR=$2 cmake --install "$1" --component "$component" >/dev/null
done
