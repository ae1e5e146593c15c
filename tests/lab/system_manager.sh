#!/bin/bash
# Runs systemd in namespaces of its own, as an administrator's server has it: only the journal, and what is asked for.
#
# usage: system_manager.sh start                 (inside a node; returns when it answers)
#        system_manager.sh run COMMAND...        what the command says is of that systemd
#        system_manager.sh stop
set -euo pipefail
pid_file=/run/system-manager.pid

manager() { cat "$pid_file"; }
inside() { nsenter --target "$(manager)" --mount --pid --cgroup "$@"; }

# Becomes systemd. The mounts that it makes for a service must be seen by that service.
become_manager() {
  mount --make-rshared /
  mount -t cgroup2 cgroup2 /sys/fs/cgroup
  mkdir -p /run/systemd
  mount -t tmpfs -o mode=755 tmpfs /run/systemd
  mkdir -p /run/systemd/system
  # Of what belongs to the start of a machine only the journal is wanted.
  local unit
  for unit in /lib/systemd/system/sysinit.target.wants/* /lib/systemd/system/sockets.target.wants/*udevd*; do
    [[ $unit == *journald* ]] || ln -sf /dev/null "/run/systemd/system/${unit##*/}"
  done
  printf '[Unit]\nDescription=Nothing\nDefaultDependencies=no\n' >/run/systemd/system/nothing.target
  export container=lab
  exec /lib/systemd/systemd --system --unit=nothing.target
}

start() {
  unshare --mount --pid --cgroup --fork --mount-proc "$0" become >/dev/null 2>&1 </dev/null &
  local starter=$! count
  for ((count = 0; count < 200; count++)); do
    if pgrep --parent "$starter" >"$pid_file" && [[ $(inside systemctl is-system-running 2>/dev/null) == running ]]; then
      return
    fi
    sleep 0.1
  done
  echo "systemd did not start" >&2
  exit 1
}

case ${1-} in
  start) start ;;
  become) become_manager ;;
  run) shift; inside "$@" ;;
  stop) kill -KILL "$(manager)" ;;
  *) sed -n '4,6s/^# //p' "$0" >&2; exit 2 ;;
esac
