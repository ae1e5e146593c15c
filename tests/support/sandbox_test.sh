#!/bin/sh
# sandbox_test.sh VELMOR-SANDBOX: what a program changes in the sandbox must not be seen on the machine.
# The commands in single quotes are expanded inside the sandbox.
# shellcheck disable=SC2016
set -eu
sandbox=$1

# Everything that the program below changes, as the machine sees it.
machine() {
  hostname
  for file in /etc/hosts /etc/resolv.conf /etc/nsswitch.conf /etc/hostname; do
    if [ -e "$file" ]; then cksum "$file"; stat -c '%n %i %a %Y' "$file"; fi
  done
  for folder in /etc /etc/quenix /usr/libexec /usr/libexec/velmor /var/lib /var/lib/quenix /var/lib/samba /run; do
    if [ -e "$folder" ]; then echo "$folder"; ls -a "$folder"; else echo "no $folder"; fi
  done
  cat /proc/self/mountinfo
  cut -d: -f1 /proc/net/dev
}

fail() {
  echo "$1" >&2
  exit 1
}

before=$(machine)

inside=$("$sandbox" sh -ec '
  echo changed > /etc/velmor-sandbox-probe
  echo changed > /etc/hosts
  rm /etc/resolv.conf
  echo "provider = \"x\"" > /etc/quenix/velmor/provider.conf
  touch /usr/libexec/velmor/libprobe.so /var/lib/quenix/probe /var/lib/samba/probe /run/velmor-probe
  hostname changed
  ip link add probe0 type veth peer name probe1 2>/dev/null || true
  cat /etc/hosts; hostname; cat /proc/1/comm
')
[ "$inside" = "changed
changed
velmor-sandbox" ] || fail "the sandbox does not take changes, or has no /proc of its own: $inside"

after=$(machine)
[ "$before" = "$after" ] || fail "the machine was changed"

# What one program leaves must not reach the next.
"$sandbox" sh -ec '
  test ! -e /etc/velmor-sandbox-probe
  test "$(ls /etc/quenix)" = velmor
  test -z "$(ls /etc/quenix/velmor /usr/libexec/velmor /var/lib/quenix /var/lib/samba | grep -v :)"
  test "$(hostname)" = sandbox
  grep -q localhost /etc/hosts
' || fail "a new sandbox is not clean"

# The program's end is the sandbox's end.
status=0
"$sandbox" sh -c 'exit 7' || status=$?
[ $status = 7 ] || fail "exit status 7 came back as $status"
status=0
"$sandbox" sh -c 'kill -SEGV $$' 2>/dev/null || status=$?
[ $status = 139 ] || fail "death by signal 11 came back as $status"
status=0
"$sandbox" /nonexistent 2>/dev/null || status=$?
[ $status = 125 ] || fail "a missing program came back as $status"

# A signal reaches the program, and nothing outlives it.
marker=$(mktemp)
trap 'rm -f "$marker"' EXIT
"$sandbox" sh -c 'sleep 1000 & trap "exit 9" TERM; echo ready > "$1"; while :; do sleep 0.1; done' sh "$marker" &
launcher=$!
while ! [ -s "$marker" ]; do sleep 0.05; done
kill -TERM $launcher
status=0
wait $launcher || status=$?
[ $status = 9 ] || fail "a signalled program came back as $status"

: > "$marker"
"$sandbox" sh -c 'exec 8>>"$1"; echo ready >&8; sleep 1000' sh "$marker" &
launcher=$!
while ! [ -s "$marker" ]; do sleep 0.05; done
kill -KILL $launcher
wait $launcher || true
# The kernel kills the rest at once; the file's last user is gone when nobody holds it open any more.
tries=0
# shellcheck disable=SC2010 # the targets of the links are wanted, not the names
while ls -l /proc/[0-9]*/fd 2>/dev/null | grep -qF "$marker"; do
  tries=$((tries + 1))
  [ $tries -lt 200 ] || fail "a killed launcher left processes behind"
  sleep 0.05
done
