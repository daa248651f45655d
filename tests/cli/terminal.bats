#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper
load terminal

teardown() {
    terminal_stop
}

@test "the terminal shows what a program wrote, and its status" {
    terminal_run -w 40 -- bash -c 'printf "one\n\ntwo\n"; exit 7'
    expect_status 7
    expect_screen $'one\n\ntwo\n'
}

@test "the terminal has the size and the variables that were asked for" {
    terminal_run -w 41 -h 10 -e NO_COLOR=1 -u TOVI_BUILD_DIR -- bash -c 'stty size </dev/tty; env | grep -E "^(TERM|NO_COLOR|COLUMNS|TOVI_BUILD_DIR)=" | sort'
    expect_screen $'10 41\nNO_COLOR=1\nTERM=xterm-256color\n'
}

@test "the terminal takes keys, and tells a signal that ended the program" {
    terminal_start -- bash -c 'read -r line; echo "got $line"; read -r -d "" forever; echo unseen'
    terminal_keys "a word" Enter
    terminal_expect "got a word"
    terminal_keys C-c
    terminal_wait
    expect_status 130
}

@test "much output is on the screen in whole when the program has ended" {
    terminal_run -w 20 -- seq 5000
    [ "$(wc -l <"$screen")" -eq 5000 ]
    [ "$(tail -1 "$screen")" = 5000 ]
}
