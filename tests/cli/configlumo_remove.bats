#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    lumo configlumo add -n vm -c "$container"
    expect_status 0
    uuid="$(volume_uuid vm)"
    directory="$TOVI_ROOT/volumes/$container_name/vm"
}

# expect_gone: neither the array nor the host has anything of it.
expect_gone() {
    [ -z "$(volume_uuid vm)" ]
    [ ! -e "$directory" ]
    [ ! -e "$TOVI_ROOT/lumos/$uuid" ]
}

@test "by name" {
    lumo configlumo remove --name vm --container-id "$container"
    expect_done $'true\n'
    expect_gone
}

@test "by uuid, which counts when both are given" {
    lumo configlumo remove -u "$uuid" -n nonsense -c "$container" --priority
    expect_done $'true\n'
    expect_gone
}

@test "a mounted one with content" {
    lumo configlumo mount -n vm -c "$container"
    mkdir "$directory/sub"
    echo content >"$directory/sub/file"
    lumo configlumo remove -n vm -c "$container"
    expect_done $'true\n'
    expect_gone
}

@test "in JSON the result is true" {
    json_of configlumo remove -n vm -c "$container"
    expect_status 0
    expect_json 'd is True'
}

@test "neither name nor uuid" {
    lumo configlumo remove -c "$container"
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Either name or uuid is required"
}

@test "a container that is not mounted" {
    lumo configlumo remove -n vm -c nonsense
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Failed to find Lumo StorageContainer nonsense"
}

@test "a volume that does not exist" {
    lumo configlumo remove -n other -c "$container"
    expect_failure 1 "other"
}

@test "without a daemon nothing is lost" {
    lumo configlumo mount -n vm -c "$container"
    echo content >"$directory/file"
    host_down
    lumo configlumo remove -n vm -c "$container"
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
    host_up
    lumo configlumo mount -n vm -c "$container"
    [ "$(cat "$directory/file")" = content ]
}
