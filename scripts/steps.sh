# Shared by ./check and ./demo: runs a step, names it, and shows its output only when it fails or
# when it takes long enough that someone would wonder.

# step NAME COMMAND...
step() {
    local name=$1 log started status=0 pid shown=0
    shift
    log=$(mktemp)
    # shellcheck disable=SC2064
    trap "rm -f '$log'" EXIT
    started=$SECONDS
    printf -- '-- %s' "$name"
    "$@" >"$log" 2>&1 &
    pid=$!
    # shellcheck disable=SC2064
    trap "kill $pid 2>/dev/null; wait $pid 2>/dev/null; rm -f '$log'; exit 130" INT TERM
    while kill -0 "$pid" 2>/dev/null; do
        sleep 0.1
        if ((SECONDS - started >= shown + 5)); then
            shown=$((SECONDS - started))
            step_progress "$log"
        fi
    done
    wait "$pid" || status=$?
    trap - INT TERM EXIT
    if ((status != 0)); then
        printf ': failed after %d s\n' $((SECONDS - started))
        tail -n 60 "$log" >&2
        rm -f "$log"
        exit "$status"
    fi
    printf ' (%d s)\n' $((SECONDS - started))
    rm -f "$log"
}

# Prints the newest line of a step's output, on the same line where the output is a terminal.
step_progress() {
    local newest
    newest=$(tail -n 1 "$1" | tr -d '\r' | cut -c1-90)
    if [ -t 1 ]; then
        printf '\r\033[K   %s' "$newest"
    else
        printf '\n   %s' "$newest"
    fi
}

# Configures a preset, every time: what a preset says may have changed since the last run.
configure_preset() {
    cmake --preset "$1"
}
