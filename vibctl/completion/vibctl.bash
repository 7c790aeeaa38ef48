# SPDX-License-Identifier: Apache-2.0
# Bash completion for vibctl. Methods and enumerators are read from vibctl's own help, so they are
# always those of the vibctl that is completed.

# The names of the methods of an interface, "std" or "ext".
_vibctl_methods() {
    "$1" "$2" help 2>/dev/null | sed -n 's/^  \([A-Za-z]*\).*/\1/p'
}

# What one argument of a method accepts, as far as that is a choice: enumerators, true and false.
_vibctl_argument() {
    "$1" "$2" "$3" --help 2>/dev/null | sed -n "$(($4 + 1))"'{
        s/^  [A-Z_]*: //
        s/^true or false$/true, false,/
        /, or any number$/!{/^true, false,$/!d}
        s/, or any number$//
        s/ -\{0,1\}[0-9]*\(,\|$\)/ /g
        s/,/ /g
        p
    }'
}

_vibctl() {
    local program=${COMP_WORDS[0]} current=${COMP_WORDS[COMP_CWORD]} choices="" word
    local -a plain=()
    local skip="" i
    # The words before this one that are neither options nor the value of an option.
    for ((i = 1; i < COMP_CWORD; i++)); do
        word=${COMP_WORDS[i]}
        if [[ -n $skip ]]; then
            skip=""
        elif [[ $word =~ ^--(wait|timeout|amplitudes|repeat)$ ]]; then
            skip=1
        elif [[ $word != --* ]]; then
            plain+=("$word")
        fi
    done
    COMPREPLY=()
    [[ -n $skip ]] && return
    if [[ $current == -* ]]; then
        choices="--json --timeout --wait --callback --off-on-interrupt --amplitudes --repeat --explain
            --help --version"
    elif ((${#plain[@]} == 0)); then
        choices="std ext info dump raw play session list doctor help"
    elif [[ ${plain[0]} == help && ${#plain[@]} == 2 ]]; then
        choices=$(_vibctl_methods "$program" "${plain[1]}")
    elif ((${#plain[@]} == 1)) && [[ ${plain[0]} =~ ^(dump|raw|help)$ ]]; then
        choices="std ext"
    elif [[ ${plain[0]} == std || ${plain[0]} == ext ]]; then
        if ((${#plain[@]} == 1)); then
            choices="help $(_vibctl_methods "$program" "${plain[0]}")"
        else
            choices=$(_vibctl_argument "$program" "${plain[0]}" "${plain[1]}" $((${#plain[@]} - 1)))
        fi
    fi
    # Files are completed by the shell.
    if [[ ${plain[0]:-} == play && $current != -* ]]; then
        mapfile -t COMPREPLY < <(compgen -f -- "$current")
        return
    fi
    # Newlines and spaces both separate the choices.
    # shellcheck disable=SC2207
    COMPREPLY=($(compgen -W "$choices" -- "$current"))
}

complete -F _vibctl vibctl
