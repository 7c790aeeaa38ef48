# Shared by the project's commands: runs a step, names it, and shows its output only when it fails or
# when it takes long enough that someone would wonder. Whatever a command starts ends with it.

# in_group COMMAND...: starts a command in the background as a process group of its own, its id in
# $group, so that end_group reaches what it has started in turn.
in_group() {
    set -m
    "$@" </dev/null &
    group=$!
    set +m
}

end_group() {
    kill -TERM -- "-$group" 2>/dev/null || true
    wait "$group" 2>/dev/null || true
}

# whole COMMAND...: runs a command whose output is shown as it comes; its status is the function's.
whole() {
    local status=0
    in_group "$@"
    trap 'end_group; exit 130' INT TERM HUP
    wait "$group" || status=$?
    end_group
    trap - INT TERM HUP
    return "$status"
}

# step NAME COMMAND...
step() {
    local name=$1 log started status=0 shown=0
    shift
    log=$(mktemp)
    started=$SECONDS
    printf -- '-- %s' "$name"
    in_group "$@" >"$log" 2>&1
    # shellcheck disable=SC2064
    trap "rm -f '$log'" EXIT
    trap 'end_group; exit 130' INT TERM HUP
    while kill -0 "$group" 2>/dev/null; do
        sleep 0.1
        if ((SECONDS - started >= shown + 5)); then
            shown=$((SECONDS - started))
            step_progress "$log"
        fi
    done
    wait "$group" || status=$?
    end_group
    trap - INT TERM HUP EXIT
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
