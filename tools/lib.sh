# shellcheck shell=bash
# Shared by the scripts of this project; source it, do not run it.
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)
build=$root/build
logs=$build/logs
jobs=${VELMARK5_JOBS:-$(nproc)}

# The private 32-bit Java runtime lives outside the tree. Its name ends in Debian's Java version and a number of our own:
# raise the number when the layout below it changes.
jre32=${XDG_CACHE_HOME:-${HOME:-/tmp}/.cache}/velmark5/jre-i386-17-1

fail() {
  echo "velmark5: $*" >&2
  exit 1
}

# log_name TITLE: the log file of a stage or suite.
log_name() {
  mkdir -p "$logs"
  echo "$logs/$(tr -cs 'a-zA-Z0-9\n' - <<<"$1").log"
}

# start LOG COMMAND...: starts the command in the background, in a process group of its own that an interrupt of this
# script ends as a whole; sets started. finish_started waits for it and returns its exit code.
start() {
  local log=$1
  shift
  set -m
  "$@" </dev/null >"$log" 2>&1 &
  started=$!
  set +m
  trap 'kill -- -"$started" 2>/dev/null; exit 130' INT TERM
}

finish_started() {
  local rc=0
  wait "$started" || rc=$?
  trap - INT TERM
  return "$rc"
}

# stage TITLE COMMAND...: runs the command with its output in a log file and prints one line with the time it took. A
# long command shows its last line of output every 20 seconds; a failed one shows the end of its log.
stage() {
  local title=$1 log rc=0 begin=$SECONDS next=20
  shift
  log=$(log_name "$title")
  start "$log" "$@"
  while kill -0 "$started" 2>/dev/null; do
    sleep 0.2
    if ((SECONDS - begin >= next)); then
      next=$((next + 20))
      echo "  ... $title, $((SECONDS - begin)) s: $(tail -n 1 "$log" | tr -d '\r' | cut -c 1-100)"
    fi
  done
  finish_started || rc=$?
  if ((rc)); then
    echo "  $title: failed after $((SECONDS - begin)) s (exit code $rc); the end of $log:"
    tail -n 40 "$log"
  else
    printf '  %-52s %4d s\n' "$title" $((SECONDS - begin))
  fi
  return "$rc"
}

# build_preset NAME [TARGET...]: configures and builds one preset.
build_preset() {
  local preset=$1
  shift
  (cd "$root" && cmake --preset "$preset" && ninja -C "build/$preset" -j "$jobs" "$@")
}

# start_xvfb [OPTION...]: starts an X server on a free display, sets xvfb_pid, and DISPLAY for the commands that follow.
start_xvfb() {
  local answer i
  answer=$(mktemp)
  Xvfb -displayfd 3 -screen 0 1920x1200x24 -nolisten tcp -noreset "$@" 3>"$answer" >/dev/null 2>&1 </dev/null &
  xvfb_pid=$!
  for ((i = 0; i < 200; i++)); do
    [ -s "$answer" ] && break
    kill -0 "$xvfb_pid" 2>/dev/null || break
    sleep 0.1
  done
  DISPLAY=$(cat "$answer")
  rm -f "$answer"
  if [ -z "$DISPLAY" ]; then
    stop_xvfb
    unset DISPLAY
    echo "velmark5: Xvfb did not start" >&2
    return 1
  fi
  export DISPLAY=:$DISPLAY
}

stop_xvfb() {
  [ -n "${xvfb_pid:-}" ] || return 0
  kill "$xvfb_pid" 2>/dev/null || true
  wait "$xvfb_pid" 2>/dev/null || true
  xvfb_pid=
}
