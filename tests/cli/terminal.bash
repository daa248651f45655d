# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Programs on a real terminal: one at a time, in a tmux server of the test's own that only its socket leads to.
#
#   load helper
#   load terminal
#   teardown() { terminal_stop; host_down; }
#
#   terminal_run -w 60 -- tovicli --help          # start, wait for the end; leaves $status and $screen
#   terminal_start -e TERM=dumb -- tovicli ...    # start only
#   terminal_expect "3 of 10"                     # wait until the screen shows it
#   terminal_expect_gone "3 of 10"                # wait until it no longer does
#   terminal_keys C-c                             # press keys, by tmux's names
#   terminal_wait                                 # wait for the end; leaves $status and $screen
#
# Everything waits for what it wants to see, at most $terminal_patience seconds. The end of a program is seen when all of
# its output is on the screen.

terminal_dir="$BATS_TEST_TMPDIR/terminal"
terminal_patience=30
screen="$BATS_TEST_TMPDIR/screen"
colours="$BATS_TEST_TMPDIR/colours"

terminal_tmux() {
    tmux -S "$terminal_dir/socket" -f "$terminal_dir/configuration" "$@" 3>&-
}

# terminal_start [-w COLUMNS] [-h LINES] [-e NAME=VALUE]... [-u NAME]... -- COMMAND [ARGS]
# Runs the command in a new terminal of that size (80 by 24), with the test's environment and TERM=xterm-256color.
# -e sets a variable, -u takes one out. COLUMNS, LINES and NO_COLOR come from -e alone.
terminal_start() {
    local width=80 height=24 option
    local environment=(TERM=xterm-256color) unset=(-u COLUMNS -u LINES -u NO_COLOR -u TMUX -u TMUX_PANE)
    local OPTIND=1 OPTARG
    while getopts "w:h:e:u:" option; do
        case "$option" in
        w) width="$OPTARG" ;;
        h) height="$OPTARG" ;;
        e) environment+=("$OPTARG") ;;
        u) unset+=(-u "$OPTARG") ;;
        *) return 1 ;;
        esac
    done
    shift $((OPTIND - 1))
    terminal_stop
    mkdir -p "$terminal_dir"
    printf '%s\n' "set -g remain-on-exit on" "set -g status off" "set -g history-limit 20000" \
        "set -g allow-rename off" >"$terminal_dir/configuration"
    # The end is told through the terminal, behind the program's output, and the terminal is kept open: what a program
    # wrote last could be lost with it. The trap lets a signal of the keyboard's end the program and not what runs it.
    # shellcheck disable=SC2016 # expanded by the shell in the terminal
    local run='trap : INT QUIT; file=$1; shift
        "$@"
        echo $? >"$file"; printf "\033]2;program ended\007"; exec tail -f /dev/null'
    terminal_tmux new-session -d -x "$width" -y "$height" -- \
        env "${unset[@]}" "${environment[@]}" bash -c "$run" bash "$terminal_dir/status" "$@" </dev/null
}

# terminal_look: what the terminal shows now, with what has scrolled off, into $screen; with colours as escape
# sequences into $colours. Lines that the terminal broke stand as broken; blanks at the ends of lines are left out.
terminal_look() {
    terminal_tmux capture-pane -p -S - >"$screen.new"
    # Rows below the last text are the terminal's, not the program's.
    sed -e :a -e '/^\n*$/{$d;N;ba' -e '}' "$screen.new" >"$screen"
    terminal_tmux capture-pane -p -e -S - >"$colours"
}

terminal_ended() {
    [ "$(terminal_tmux display-message -p '#{pane_title}')" = "program ended" ]
}

# Lets a moment pass.
terminal_moment() {
    timeout 0.05 tmux -S "$terminal_dir/socket" wait-for never 3>&- || true
}

terminal_mismatch() {
    {
        echo "expected $1; the terminal shows:"
        cat -A "$screen"
    } >&2
    return 1
}

# terminal_expect TEXT: waits until a line of the screen holds this text.
terminal_expect() {
    local limit=$((SECONDS + terminal_patience))
    until terminal_look && grep -qF -- "$1" "$screen"; do
        [ "$SECONDS" -lt "$limit" ] || terminal_mismatch "the screen to show: $1" || return 1
        terminal_moment
    done
}

# terminal_expect_gone TEXT: waits until no line of the screen holds this text.
terminal_expect_gone() {
    local limit=$((SECONDS + terminal_patience))
    while terminal_look && grep -qF -- "$1" "$screen"; do
        [ "$SECONDS" -lt "$limit" ] || terminal_mismatch "the screen no longer to show: $1" || return 1
        terminal_moment
    done
}

# terminal_keys KEY...: presses keys: texts, or names such as Enter, Tab, C-c, Up.
terminal_keys() {
    terminal_tmux send-keys -- "$@"
}

# terminal_resize COLUMNS LINES
terminal_resize() {
    terminal_tmux resize-window -x "$1" -y "$2"
}

# terminal_wait: waits for the program's end. Leaves $status (128 and the signal's number when one ended it), $screen
# and $colours.
terminal_wait() {
    local limit=$((SECONDS + terminal_patience))
    until terminal_ended; do
        [ "$SECONDS" -lt "$limit" ] || { terminal_look && terminal_mismatch "the program to end"; } || return 1
        terminal_moment
    done
    terminal_look
    # shellcheck disable=SC2034 # read by the tests
    status="$(cat "$terminal_dir/status")"
}

# terminal_run: terminal_start and terminal_wait.
terminal_run() {
    terminal_start "$@"
    terminal_wait
}

# terminal_stop: ends this test's tmux server, and with it the program on it, if there is one.
terminal_stop() {
    if [ -S "$terminal_dir/socket" ]; then
        terminal_tmux kill-server 2>/dev/null || true
        rm -rf "$terminal_dir"
    fi
}

# expect_screen TEXT: the screen is exactly this, ended by one newline; expect_screen - takes it from standard input.
expect_screen() {
    expect_file "$screen" "the screen" "$1"
}
