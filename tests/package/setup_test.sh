#!/bin/bash
# usage: setup_test.sh SETUP fails|is_interrupted, in a sandbox
#
# However an installation ends, the services that it brought do not start at the next boot, and those that were
# there before do.
set -euo pipefail
how=$2
mkdir -p /run/project /run/stand-ins
cp "$1" /run/project/setup
mount -t tmpfs sandbox /usr/sbin
mount -t tmpfs sandbox /usr/lib/systemd/system
touch /usr/lib/systemd/system/nmbd.service

# They stand for the programs that would change the machine.
cd /run/stand-ins
install -m 755 /dev/stdin dpkg-query <<'PROGRAM'
#!/bin/sh
exit 1
PROGRAM
install -m 755 /dev/stdin apt-get <<PROGRAM
#!/bin/sh
[ "\$1" = install ] || exit 0
cd /usr/lib/systemd/system
touch smbd.service winbind.service
[ $how != is_interrupted ] || kill -TERM \$PPID
exit 100
PROGRAM
install -m 755 /dev/stdin update-rc.d <<'PROGRAM'
#!/bin/sh
echo "$@" >>/run/calls
PROGRAM

status=0
PATH=/run/stand-ins:$PATH /run/project/setup >/run/output 2>&1 || status=$?
if [[ $how == is_interrupted ]]; then expected=130; else expected=1; fi
[[ $status == "$expected" ]] || { echo "it ends with $status"; cat /run/output; exit 1; }
touch /run/calls
[[ $(cat /run/calls) == $'smbd disable\nwinbind disable' ]] || { echo "called: $(cat /run/calls)"; exit 1; }
[[ ! -e /usr/sbin/policy-rc.d ]] || { echo "services cannot be started any more"; exit 1; }
