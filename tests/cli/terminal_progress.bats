#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What a user sees of a command that takes long, and what Ctrl-C makes of it, whoever keeps it waiting.
load helper
load terminal

stopped=""

teardown() {
    terminal_stop
    [ -z "$stopped" ] || kill -CONT "$stopped"
    release_lock
    host_down
}

# silent_daemon: the daemon takes connections and says nothing, until the test's end.
silent_daemon() {
    stopped="$(cat "$TOVI_ROOT/run/lumod.pid")"
    kill -STOP "$stopped"
}

@test "time is shown while a provider is silent, and gone before the result" {
    host_up
    register_provider
    hold_lock "$LUMO_ARRAY_FILE"
    terminal_start -- tovicli storage internal lumo storagecontainer load --format table --fields "StorageContainer Name"
    terminal_expect "tovicli: working, "
    release_lock
    terminal_wait
    expect_status 0
    expect_screen $'StorageContainer Name\n---------------------\ngold\nsilver\narchive\n'
}

@test "the count is shown while containers are loaded" {
    "$top/lab/generate-topology" --containers 2000 --arrays 1 --endpoints 1 >"$BATS_TEST_TMPDIR/large.json"
    host_up --topology "$BATS_TEST_TMPDIR/large.json"
    register_provider
    terminal_start -- tovicli storage internal lumo storagecontainer load
    terminal_expect " of 2000 done"
    terminal_keys C-c
    terminal_wait
    expect_status 130
    expect_screen $'tovicli: interrupted; part of the work may have been done\n'

    # What was loaded before is not counted again.
    loaded="$(sqlite3 "$TOVI_ROOT/host.db" 'SELECT count(*) FROM file_system')"
    [ "$loaded" -gt 0 ]
    [ "$loaded" -lt 2000 ]
    terminal_start -- tovicli storage internal lumo storagecontainer load
    terminal_expect " of $((2000 - loaded)) done"
    terminal_keys C-c
    terminal_wait
    expect_status 130
}

@test "Ctrl-C ends a command that waits for a silent daemon" {
    host_up
    silent_daemon
    terminal_start -- tovicli storage internal lumo storagecontainer load
    terminal_expect "tovicli: working, "
    terminal_keys C-c
    terminal_wait
    expect_status 130
    expect_screen $'tovicli: interrupted; part of the work may have been done\n'
}

@test "Ctrl-C ends a command that waits for a silent provider, and the daemon serves on" {
    host_up
    register_provider
    hold_lock "$LUMO_ARRAY_FILE"
    terminal_start -- tovicli storage internal lumo storagecontainer load
    terminal_expect "tovicli: working, "
    terminal_keys C-c
    terminal_wait
    expect_status 130
    release_lock
    load_containers
}

@test "the terminal works as before afterwards" {
    host_up
    silent_daemon
    terminal_start -- bash -c 'before=$(stty -g </dev/tty); trap : INT
        tovicli storage internal lumo storagecontainer load
        [ "$before" = "$(stty -g </dev/tty)" ] && echo "as before"'
    terminal_expect "tovicli: working, "
    terminal_keys C-c
    terminal_wait
    expect_screen $'tovicli: interrupted; part of the work may have been done\nas before\n'
}

@test "nothing is drawn on a dumb terminal" {
    host_up
    silent_daemon
    terminal_start -e TERM=dumb -- tovicli --timeout 1500ms storage internal lumo storagecontainer load
    terminal_wait
    expect_status 3
    run ! grep -F "working" "$screen"
}
