# SPDX-License-Identifier: Apache-2.0
# Completions of fixwell for fish. The program says what may stand where the cursor is; fish quotes it.
# What a line end is in cannot be offered; its disk can be named by its device.

function __fixwell_reply
    set -l words (commandline -opc) (commandline -ct)
    command fixwell --complete plain $words[2..-1] 2>/dev/null | string split0
end

function __fixwell_takes_files
    set -l reply (__fixwell_reply)
    test "$reply[1]" = files
end

function __fixwell_candidates
    set -l reply (__fixwell_reply)
    for i in (seq 2 2 (count $reply))
        set -l value $reply[$i]
        string match -qr '[\n\t]' -- $value; and continue
        printf '%s\t%s\n' $value $reply[(math $i + 1)]
    end
end

complete -c fixwell -f -a '(__fixwell_candidates)'
complete -c fixwell -n __fixwell_takes_files -F
