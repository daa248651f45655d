#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_without_daemon
    export TOVI_OFFLINE=1 # nothing here needs the daemon; no warning that it is away
}

@test "a provider without arrays is registered" {
    lumo orkaprovider add --vp-name lab --vp-url file:///lab.array
    expect_done $'Succesfully Added VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array' ]
}

@test "short names of the parameters" {
    lumo orkaprovider add -v lab -U file:///lab.array -a one -p 1 -i true
    expect_done $'Succesfully Added VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array|one/1/1' ]
}

@test "the n-th array id, priority and active flag belong together" {
    lumo orkaprovider add --vp-name lab --vp-url u --arrayid one --arrayid two --priority 7 --isactive true --priority -1 \
        --isactive false
    expect_done $'Succesfully Added VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|u|one/1/7|two/0/-1' ]
}

@test "a priority keeps its low 32 bits" {
    lumo orkaprovider add --vp-name lab --vp-url u --arrayid one --priority 4294967297 --isactive TRUE
    expect_done $'Succesfully Added VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|u|one/1/1' ]
}

@test "the URL is stored as given, an empty one too" {
    lumo orkaprovider add --vp-name lab --vp-url ""
    expect_done $'Succesfully Added VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|' ]
}

@test "in JSON the result is one text" {
    json_of orkaprovider add --vp-name lab --vp-url u
    expect_status 0
    expect_json 'd == "Succesfully Added VP with name : lab\n"'
}

@test "an empty name is refused" {
    lumo orkaprovider add --vp-name "" --vp-url u
    expect_failure 1 "Empty VP Name not allowed."
    [ "$(stored_providers)" = "" ]
}

@test "a name that exists is refused, whatever else is given" {
    lumo orkaprovider add --vp-name lab --vp-url first
    lumo orkaprovider add --vp-name lab --vp-url second --arrayid one
    expect_failure 1 "Cannot Add VP as : lab already exists"
    [ "$(stored_providers)" = 'lab|first' ]
}

@test "lists of different lengths are refused and nothing is written" {
    lumo orkaprovider add --vp-name lab --vp-url u --arrayid one --arrayid two --priority 1 --isactive true --isactive true
    expect_failure 1 "Missing one of the  parameter arrayIdor priority or isActive for an Array "
    [ "$(stored_providers)" = "" ]
}

@test "a failure in a machine format is an error object on standard error" {
    json_of orkaprovider add --vp-name "" --vp-url u
    expect_failure 1 '{"error":' 'Empty VP Name not allowed.'
}

@test "a store that cannot be written is told with its path" {
    lumo orkaprovider add --vp-name lab --vp-url u
    expect_status 0
    if [ "$(id -u)" -eq 0 ]; then
        # Root, but not by right of writing everywhere.
        tovicli() {
            setpriv --bounding-set=-dac_override "$TOVI_BUILD_DIR/bin/tovicli" "$@"
        }
    fi
    chmod 444 "$TOVI_ROOT/host.db"
    chmod 555 "$TOVI_ROOT"
    lumo orkaprovider add --vp-name other --vp-url u
    chmod 755 "$TOVI_ROOT"
    expect_failure 1 "Failed to add VP: " "$TOVI_ROOT/host.db"
}

@test "fault_49 a store that another process holds is told after the wait" {
    lumo orkaprovider add --vp-name lab --vp-url u
    hold_lock "$TOVI_ROOT/host.db"
    local began="${EPOCHREALTIME//[!0-9]/}"
    lumo orkaprovider add --vp-name other --vp-url u
    local waited=$((${EPOCHREALTIME//[!0-9]/} - began))
    release_lock
    expect_failure 1 "$TOVI_ROOT/host.db" "5000 ms"
    [ "$waited" -ge 5000000 ]
    [ "$(stored_providers)" = 'lab|u' ]
}
