# shellcheck shell=bash
# Sourced. KIV_EMULATOR is the command that runs the programs of a cross build, word by word; else it is empty.

# Puts a script in the place of each of these programs, which has the emulator run it.
emulate() # program...
{
    local program
    [[ ${KIV_EMULATOR-} ]] || return 0
    for program in "$@"; do
        mv "$program" "$program.target"
        printf '#!/bin/sh\nexec %s "%s" "$@"\n' "$KIV_EMULATOR" "$program.target" >"$program"
        chmod 755 "$program"
    done
}
