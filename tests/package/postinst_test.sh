#!/bin/bash
# usage: postinst_test.sh POSTINST, in a sandbox
#
# A service that does not start again leaves the package configured, and the administrator is told.
set -euo pipefail
mkdir -p /run/systemd/system /run/stand-ins /run/upper/sysusers.d /run/work
touch /run/upper/sysusers.d/velmor-camd.conf
mount -t overlay -o lowerdir=/usr/lib,upperdir=/run/upper,workdir=/run/work sandbox /usr/lib

# They stand for the programs that would change the machine.
for program in ldconfig systemd-sysusers systemctl; do
  install -m 755 /dev/stdin "/run/stand-ins/$program" <<'PROGRAM'
#!/bin/sh
[ "$1" != try-restart ]
PROGRAM
done

PATH=/run/stand-ins:$PATH "$1" configure 2>/run/errors || { echo "the package is left half configured"; exit 1; }
grep -q 'velmor-camd does not start again' /run/errors || { echo "nothing is said"; exit 1; }
