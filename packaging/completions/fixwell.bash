# SPDX-License-Identifier: Apache-2.0
# Completions of fixwell for bash. The program itself says what may stand where the cursor is, already
# quoted; nothing of it is evaluated here. Needs no other package.

_fixwell() {
    local -a reply
    mapfile -t reply < <(command fixwell --complete bash "${COMP_LINE:0:COMP_POINT}" "$2" 2>/dev/null)
    COMPREPLY=("${reply[@]:1}")
    [[ ${reply[0]} == *files* ]] || compopt +o default
    [[ ${reply[0]} == *nospace* ]] && compopt -o nospace
    return 0
}
complete -o default -F _fixwell fixwell
