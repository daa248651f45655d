#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_without_daemon
    export TOVI_OFFLINE=1
}

prefix="Failed to update host Orka context Uuid: "

stored_context() {
    sqlite3 "$TOVI_ROOT/host.db" "SELECT value FROM setting"
}

@test "a context is stored as typed" {
    lumo orkacontext set --uuid Any-Text
    expect_done $'true\n'
    [ "$(stored_context)" = "Any-Text" ]
}

@test "a later one replaces it" {
    lumo orkacontext set -u first
    lumo orkacontext set -u second
    expect_done $'true\n'
    [ "$(stored_context)" = "second" ]
}

@test "it is cleared" {
    lumo orkacontext set --uuid first
    lumo orkacontext set --clear
    expect_done $'true\n'
    [ "$(stored_context)" = "" ]
    lumo orkacontext set -c
    expect_done $'true\n'
}

# A result was set beside the message: it is printed, and the status is a failure's.
@test "both are refused" {
    lumo orkacontext set --uuid first --clear
    expect_status 1
    expect_out $'false\n'
    expect_err_has "${prefix}Exactly one of --clear or --uuid must be specified!"
}

@test "neither is refused" {
    lumo orkacontext set
    expect_status 1
    expect_out $'false\n'
    expect_err_has "${prefix}Exactly one of --clear or --uuid must be specified!"
}

@test "an empty one is refused" {
    lumo orkacontext set --uuid ""
    expect_status 1
    expect_out $'false\n'
    expect_err_has "${prefix}--uuid requires a parameter"
}

@test "in JSON the result is a boolean, beside an error object" {
    json_of orkacontext set --uuid first
    expect_status 0
    expect_json 'd is True'
    json_of orkacontext set
    expect_status 1
    expect_json 'd is False'
    expect_err_has '{"error":'
}

@test "a host store that cannot be read is told with its path" {
    mkdir "$TOVI_ROOT/host.db"
    lumo orkacontext set --uuid first
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$prefix" "$TOVI_ROOT/host.db"
}
