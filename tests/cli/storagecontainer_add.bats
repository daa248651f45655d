#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    # Free again, and known by name and id.
    lumo storagecontainer remove --container-id "$container"
    expect_status 0
}

@test "a container is mounted" {
    lumo storagecontainer add --container-name "$container_name" --container-id "$container"
    expect_done $'true\n'
    [ -d "$TOVI_ROOT/volumes/$container_name" ]
}

@test "under a name of one's own, with its arrays named" {
    lumo storagecontainer add -n mine -c "$container" -a "$array"
    expect_done $'true\n'
    [ -d "$TOVI_ROOT/volumes/mine" ]
}

@test "an id in another spelling is the same container" {
    spelled="{$(tr '[:lower:]' '[:upper:]' <<<"$container")}"
    lumo storagecontainer add -n mine -c "$spelled"
    expect_done $'true\n'
    lumo storagecontainer remove -c "$container"
    expect_done $'true\n'
}

@test "in JSON the result is true" {
    json_of storagecontainer add -n mine -c "$container"
    expect_status 0
    expect_json 'd is True'
}

@test "a container that is mounted already" {
    lumo storagecontainer add -n mine -c "$container"
    lumo storagecontainer add -n other -c "$container"
    [ "$status" -eq 1 ]
    [ ! -e "$TOVI_ROOT/volumes/other" ]
    [ -d "$TOVI_ROOT/volumes/mine" ]
}

@test "a container that nobody exports" {
    lumo storagecontainer add -n mine -c 00000000-0000-0000-0000-000000000000
    expect_failure 1 "00000000-0000-0000-0000-000000000000"
    [ ! -e "$TOVI_ROOT/volumes/mine" ]
}

@test "an array that does not hold the container" {
    lumo storagecontainer add -n mine -c "$container" -a nowhere
    expect_failure 1 "nowhere"
    [ ! -e "$TOVI_ROOT/volumes/mine" ]
}

@test "an id that is none" {
    lumo storagecontainer add -n mine -c nonsense
    expect_failure 1 "nonsense"
}

@test "fault_53 a name that is no directory name" {
    for name in . .. a/b "" $'a\nb' "$(printf 'x%.0s' {1..256})"; do
        lumo storagecontainer add -n "$name" -c "$container"
        [ "$status" -eq 1 ]
        expect_out ""
        [ -s "$err" ]
    done
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo storagecontainer add -n mine -c "$container"
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
    [ ! -e "$TOVI_ROOT/volumes/mine" ]
}
