# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# What lab/up and lab/down share: which processes a root's daemon and its orkasim are. A process id alone may have passed to somebody else's
# process, so the record holds the time the process started as well, in clock ticks since the machine did.

fail() {
    echo "$program: $1" >&2
    exit 1
}

usage_error() {
    echo "$program: $1" >&2
    echo "$usage" >&2
    exit 2
}

# start_time PID: when the process started, empty when there is none (or only its remains).
start_time() {
    local stat
    { read -r stat <"/proc/$1/stat"; } 2>/dev/null || return 0
    # The command's name stands in parentheses and may hold blanks; count from behind it.
    local -a field
    read -r -a field <<<"${stat##*) }"
    [ "${field[0]}" = Z ] || echo "${field[19]}"
}

# recorded_process FILE: the id of the process that lab/up recorded there and that still runs; empty otherwise.
recorded_process() {
    local pid started
    { read -r pid started <"$1"; } 2>/dev/null || return 0
    if [ -n "$started" ] && [ "$(start_time "$pid")" = "$started" ]; then
        echo "$pid"
    fi
}
