# SPDX-License-Identifier: Apache-2.0
# Bash completion for phone. Commands and options are read from phone's own help.
_phone() {
    local current=${COMP_WORDS[COMP_CWORD]} choices
    if ((COMP_CWORD == 1)); then
        choices=$("$1" --help 2>/dev/null | sed -n '/^Subcommands:/,$s/^  \([a-z]*\) .*/\1/p')
    elif [[ $current == -* ]]; then
        choices=$("$1" "${COMP_WORDS[1]}" --help 2>/dev/null | sed -n 's/^  .*\(--[a-z-]*\).*/\1/p')
    elif [[ ${COMP_WORDS[1]} == service ]]; then
        choices="stop start restart kill"
    else
        compopt -o default 2>/dev/null  # files
        choices=""
    fi
    # shellcheck disable=SC2207
    COMPREPLY=($(compgen -W "$choices" -- "$current"))
}

complete -F _phone phone
