# Shared by the project's commands: reads their options, and runs a step, names it, shows how far it
# is on a terminal, and shows its output only when it fails. Whatever a command starts ends with it,
# also when nobody reads its output any more.

# What is built here is run by other users of the guest too.
umask 022

# show_help TEXT ARGUMENTS...: when -h or --help is among the arguments, prints the text and ends.
show_help() {
    local text=$1 argument
    shift
    for argument in "$@"; do
        case $argument in
            -h | --help)
                printf '%s\n' "$text"
                exit 0
                ;;
        esac
    done
}

# wrong_usage TEXT: says in one line what was wrong and what is accepted, and ends with status 2.
# $program is the command's name, where the file's says too little. A word of the user's may hold
# anything.
wrong_usage() {
    printf '%s: %s\n' "${program:-${0##*/}}" "${1//[[:cntrl:]]/?}" >&2
    exit 2
}

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

# Ends the running group when this command is interrupted, or when its output has no reader.
end_group_on_signals() {
    trap 'end_group; exit 130' INT TERM HUP
    trap 'end_group; exit 141' PIPE
}

# Without a reader the command still leaves by exit, so that what it has left to its end happens.
leave_signals() {
    trap - INT TERM HUP
    trap 'exit 141' PIPE
}

# whole COMMAND...: runs a command whose output is shown as it comes; its status is the function's.
whole() {
    local status=0
    in_group "$@"
    end_group_on_signals
    wait "$group" || status=$?
    end_group
    leave_signals
    return "$status"
}

# say FORMAT ARGUMENTS...: printf without its complaint when nobody reads.
say() {
    # shellcheck disable=SC2059
    printf -- "$@" 2>/dev/null
}

# step NAME COMMAND...
step() {
    local name=$1 log started status=0 shown=0
    shift
    say '-- %s' "$name"
    log=$(mktemp)
    started=$SECONDS
    # shellcheck disable=SC2064
    trap "rm -f '$log'" EXIT
    in_group "$@" >"$log" 2>&1
    end_group_on_signals
    while kill -0 "$group" 2>/dev/null; do
        sleep 0.1
        if [ -t 1 ] && ((SECONDS - started > shown)); then
            shown=$((SECONDS - started))
            step_progress "$name, $shown s" "$log"
        fi
    done
    wait "$group" || status=$?
    end_group
    leave_signals
    [ ! -t 1 ] || say '\r\033[K-- %s' "$name"
    if ((status != 0)); then
        say ': failed after %d s\n' $((SECONDS - started))
        tail -n 60 "$log" >&2
        exit "$status"
    fi
    say ' (%d s)\n' $((SECONDS - started))
    rm -f "$log"
    trap - EXIT
}

# step_progress HEAD LOG: shows the newest line of a step's output on the step's own line.
step_progress() {
    local line
    line="-- $1  $(tail -n 1 "$2" | tr -d '\r')"
    say '\r\033[K%s' "${line:0:$(($(tput cols 2>/dev/null || echo 80) - 1))}"
}

# Configures a preset, every time: what a preset says may have changed since the last run.
configure_preset() {
    cmake --preset "$1"
}

leave_signals
