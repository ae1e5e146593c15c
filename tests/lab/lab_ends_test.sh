#!/bin/bash
# A lab whose start was broken off leaves no process behind, and with the last one its mounts and interfaces go.
#
# usage: lab_ends_test.sh killed | interrupted
#   killed: lab/up is killed at once, and lab/down clears up after it
#   interrupted: lab/up is asked to end, and clears up itself
set -euo pipefail
if [[ $EUID -ne 0 ]]; then
  echo "skipped: a domain in network namespaces needs root; run it with sudo"
  exit 77
fi
lab=$(cd "$(dirname "$0")/../../lab" && pwd)
folder=$(mktemp -d)
VELMOR_LAB_DIR=$folder/state
export VELMOR_LAB_DIR
trap '"$lab/down"; rm -r "$folder"' EXIT

descendants() {
  local child
  echo "$1"
  for child in $(pgrep --parent "$1"); do descendants "$child"; done
}

mount_namespaces() { for process; do readlink "/proc/$process/ns/mnt" 2>/dev/null || true; done | sort -u; }

"$lab/up" &
up=$!
until [[ -s $VELMOR_LAB_DIR/nodes/dc1 && -s $VELMOR_LAB_DIR/nodes/host1 ]]; do
  kill -0 "$up" || exit 1
  sleep 0.1
done
read -r hub _ <"$VELMOR_LAB_DIR/hub"
mapfile -t processes < <(descendants "$hub")
mapfile -t namespaces < <(mount_namespaces "${processes[@]}")
[[ ${#namespaces[@]} -ge 3 ]] || { echo "hub, dc1 and host1 were not seen running"; exit 1; }

case $1 in
  killed) kill -KILL "$up"; wait "$up" || true; "$lab/down" ;;
  interrupted) kill -TERM "$up"; wait "$up" || true ;;
esac

left=$(readlink /proc/[0-9]*/ns/mnt 2>/dev/null | sort -u | grep -Fx "$(printf '%s\n' "${namespaces[@]}")" || true)
left+=$(grep -laF "$VELMOR_LAB_DIR" /proc/[0-9]*/cmdline 2>/dev/null || true)
[[ ! -e $VELMOR_LAB_DIR ]] || left+=$VELMOR_LAB_DIR
if [[ -n $left ]]; then
  printf 'left behind: %s\n' "$left"
  exit 1
fi
