#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# The manual pages: well-formed, found, and readable on a terminal.
load helper
load terminal

teardown() {
    terminal_stop
    host_down
}

# quiet COMMAND...: it succeeds and has nothing to complain about.
quiet() {
    "$@" >"$out" 2>"$err" </dev/null || mismatch "success of: $*"
    expect_err ""
    [ -s "$out" ]
}

@test "every page is formatted without a complaint" {
    shopt -s nullglob
    pages=("$TOVI_BUILD_DIR"/share/man/man[18]/*.[18])
    [ "${#pages[@]}" -ge 25 ]
    for page in "${pages[@]}"; do
        quiet env LC_ALL=C.UTF-8 MANWIDTH=80 man --warnings -E UTF-8 -l "$page"
        quiet groff -ww -man -Tutf8 "$page"
    done
}

@test "pages are found where the programs are" {
    for page in tovicli tovicli-storage-internal-lumo-storagecontainer-load orkasim orka-conformance lumod; do
        run -0 man -w "$page"
        [[ "$output" == "$TOVI_BUILD_DIR"/share/man/* ]]
    done
}

@test "a page's name and what it is stand where indexes look for them" {
    run -0 lexgrog "$TOVI_BUILD_DIR/share/man/man1/tovicli-storage-internal-lumo-orkaprovider-add.1"
    [[ "$output" == *'"tovicli-storage-internal-lumo-orkaprovider-add - Add a new Orka Provider on the host"' ]]
}

@test "COLUMNS counts before the terminal's width" {
    host_without_daemon
    terminal_run -w 120 -e COLUMNS=60 -e TOVI_OFFLINE=1 -- tovicli storage internal lumo orkaprovider set --help
    expect_status 0
    longest="$(wc -L <"$screen")"
    [ "$longest" -le 60 ] && [ "$longest" -gt 40 ] || mismatch "lines of 41 to 60 columns, not $longest: $(cat "$screen")"
}

@test "help is wrapped to the terminal's width" {
    host_without_daemon
    for width in 60 100; do
        terminal_run -w "$width" -e TOVI_OFFLINE=1 -- tovicli storage internal lumo daemon set --help
        expect_status 0
        longest="$(wc -L <"$screen")"
        [ "$longest" -le "$width" ]
        [ "$longest" -gt $((width - 20)) ]
    done
    grep -qE '^      --end-pe-apd TEXT +Simulate PE APD end for a given PE\.' "$screen"
}
