#!/bin/bash
# usage: postrm_test.sh POSTRM, in a sandbox
#
# What the programs have kept for themselves stays when the package is removed, and goes when it is purged; but for
# what a host that is still joined had before.
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
before=/var/lib/quenix/samba/before
mkdir -p "$before"
echo original >"$before/smb.conf"
"$1" purge 2>/run/errors
[[ $(cat "$before/smb.conf") == original ]] || { echo "purging loses the smb.conf from before the join"; exit 1; }
grep -q "$before" /run/errors || { echo "purging does not say what stays"; exit 1; }
rm -r "$before"

# Twice: dpkg repeats what was interrupted.
"$1" purge
"$1" purge
for folder in /var/lib/quenix "${kept[@]}"; do
  [[ ! -e $folder ]] || { echo "purging leaves $folder"; exit 1; }
done
[[ -d /var/lib/neighbour ]] || { echo "purging takes more than its own"; exit 1; }
