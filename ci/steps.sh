# shellcheck shell=bash
# Running a step of a longer job: says what runs and how long it took, keeps its output in a file, and shows the
# end of it when the step fails. Sourced by the root scripts, with `log_folder` set.

: "${log_folder:?}"
started_at=$SECONDS

announce() { printf '[%4d s] %s\n' "$((SECONDS - started_at))" "$*"; }

# step NAME WHAT-TO-DO-WHEN-IT-FAILS COMMAND [ARGUMENT]...
step() {
  local name=$1 remedy=$2 start=$SECONDS status=0 log
  shift 2
  log=$log_folder/${name//[^A-Za-z0-9]/-}.log
  announce "$name ..."
  "$@" >"$log" 2>&1 </dev/null || status=$?
  if [[ $status -eq 0 ]]; then
    announce "$name: done in $((SECONDS - start)) s"
    return 0
  fi
  tail -n 40 "$log" | sed 's/^/    /'
  announce "$name: FAILED with status $status after $((SECONDS - start)) s"
  printf '    all of its output: %s\n    what to do: %s\n' "$log" "$remedy"
  return "$status"
}
