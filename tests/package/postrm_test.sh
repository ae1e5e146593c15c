#!/bin/bash
# usage: postrm_test.sh POSTRM, in a sandbox
#
# What the programs have kept for themselves stays when the package is removed, and goes when it is purged.
set -euo pipefail
for folder in lib log; do
  layers=/run/$folder
  mkdir -p "$layers/upper" "$layers/work"
  mount -t overlay -o "lowerdir=/var/$folder,upperdir=$layers/upper,workdir=$layers/work" sandbox "/var/$folder"
done
kept=(/var/lib/quenix/backups/pam /var/lib/velmor-camd /var/log/velmor-camd)
mkdir -p "${kept[@]}" /var/lib/neighbour

"$1" remove
for folder in "${kept[@]}"; do
  [[ -d $folder ]] || { echo "removing takes $folder away"; exit 1; }
done
# Twice: dpkg repeats what was interrupted.
"$1" purge
"$1" purge
for folder in /var/lib/quenix "${kept[@]}"; do
  [[ ! -e $folder ]] || { echo "purging leaves $folder"; exit 1; }
done
[[ -d /var/lib/neighbour ]] || { echo "purging takes more than its own"; exit 1; }
