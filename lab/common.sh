# shellcheck shell=bash
# What the lab's commands share: places, accounts, and the ways into a node. Sourced, never run.
#
# The lab is one tree of namespaces. Its root is the hub: a process that is the first of its own pid, network
# and mount namespaces and holds a bridge and a name server. Every other node is a child of the hub with
# namespaces of its own. Ending the hub's first process therefore ends every process of the lab, and with them
# go all mounts and interfaces; that is the whole clean-up, also after a command that was killed half way.

set -euo pipefail

lab_folder=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source_folder=$(dirname "$lab_folder")
state=${VELMOR_LAB_DIR:-$source_folder/build/lab}
staged_tree=${VELMOR_STAGED_TREE:-$source_folder/build/stage}

# Made-up accounts of a domain that nobody outside the lab can reach, so nothing here is a secret.
export lab_admin_password='Adm1n-Passw0rd'
export lab_user_password='Us3r-Passw0rd'

node_path=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin

say() { printf 'lab: %s\n' "$*" >&2; }

fail() {
  say "$*"
  exit 1
}

need_root() {
  [[ $EUID -eq 0 ]] && return
  say "network namespaces and mounts need root: run it with sudo"
  exit 77
}

# The address of a node; every name that the lab knows stands here.
node_address() {
  case $1 in
    dc1) echo 10.99.0.10 ;;
    dc2) echo 10.99.0.20 ;;
    dc3) echo 10.99.0.11 ;;
    host[1-9]) echo "10.99.0.3${1#host}" ;;
    server[1-9]) echo "10.99.0.4${1#server}" ;;
    *) fail "there is no node '$1': the nodes are dc1, dc2, dc3, host1 to host9 and server1 to server9" ;;
  esac
}

# The start time that the kernel keeps with a process. With it a process id names one process for ever.
process_start_time() {
  local line fields
  line=$(cat "/proc/$1/stat" 2>/dev/null) || return 1
  read -ra fields <<<"${line##*) }"
  echo "${fields[19]}"
}

# Prints the hub's process id; fails when no hub of this state folder runs.
hub_process() {
  local process started
  [[ -r $state/hub ]] || return 1
  read -r process started <"$state/hub" || return 1
  [[ $(process_start_time "$process") == "$started" ]] || return 1
  echo "$process"
}

# Runs a command in the hub.
in_hub() {
  local process
  process=$(hub_process) || fail "the lab is not up; lab/up brings it up"
  nsenter --target "$process" --mount --uts --ipc --net --pid -- "$@"
}

# Runs a command in a node, in the current folder, with a plain environment.
in_node() {
  local node=$1 process
  shift
  read -r process 2>/dev/null <"$state/nodes/$node" || fail "node '$node' is not up; lab/status shows the nodes"
  # shellcheck disable=SC2016 # expanded by the shell inside the node
  in_hub nsenter --target "$process" --mount --uts --ipc --net --pid -- \
    env -i PATH="$node_path" HOME=/run/home TERM="${TERM:-dumb}" LANG=C.UTF-8 \
    sh -c 'cd "$0" 2>/dev/null || cd /; exec "$@"' "$PWD" "$@"
}

# Repeats a command until it succeeds, for at most the given number of seconds.
wait_until() {
  local seconds=$1 deadline
  shift
  deadline=$((SECONDS + seconds))
  until "$@"; do
    [[ $SECONDS -lt $deadline ]] || return 1
    sleep 0.1
  done
}

# Starts the first process of a node and links it to the hub's bridge.
start_node() {
  local node=$1 address
  address=$(node_address "$node")
  rm -f "$state/nodes/$node" "$state/nodes/$node.new"
  in_hub setsid --fork unshare --net --mount --uts --ipc --pid --fork --kill-child --propagation private \
    "$lab_folder/nodes/node-init" "$node" "$address" "$state" "$source_folder" \
    </dev/null >"$state/log/$node" 2>&1
  if wait_until 60 test -s "$state/nodes/$node.new"; then
    in_hub ip link add "v-$node" type veth peer name eth0 netns "$(cat "$state/nodes/$node.new")"
    in_hub ip link set "v-$node" master br0 up
  fi
  wait_until 60 test -s "$state/nodes/$node" || fail "node $node did not start; see $state/log/$node"
}

# Copies the staged installation into a node, at its real places.
install_in() {
  [[ -d $staged_tree ]] || return 0
  in_node "$1" cp -a --no-preserve=ownership "$staged_tree/." /
  in_node "$1" ldconfig
}

is_member_node() { [[ $1 == host* || $1 == server* ]]; }

# Brings up one node whole: started, provisioned when it is a domain controller, installed when it is a host.
bring_up() {
  local node=$1
  start_node "$node"
  if is_member_node "$node"; then
    install_in "$node"
  else
    in_node "$node" "$lab_folder/nodes/controller" "$node" >>"$state/log/$node" 2>&1 ||
      fail "domain controller $node did not start; see $state/log/$node"
  fi
}
