#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    lumo configlumo add -n vm -c "$container"
    lumo configlumo mount -n vm -c "$container"
    expect_status 0
    directory="$TOVI_ROOT/volumes/$container_name/vm"
}

bindings() {
    sqlite3 "$LUMO_ARRAY_FILE" "SELECT count(*) FROM volume WHERE directory_name = 'vm' AND bound_to IS NOT NULL"
}

@test "by name" {
    lumo configlumo umount --name vm --container-id "$container"
    expect_done $'true\n'
    [ ! -e "$directory" ]
}

@test "by uuid, which counts when both are given" {
    lumo configlumo umount -u "$(volume_uuid vm)" -n nonsense -c "$container" --priority
    expect_done $'true\n'
    [ ! -e "$directory" ]
}

@test "the binding is left to the unbind timer" {
    lumo configlumo umount -n vm -c "$container"
    [ "$(bindings)" = 1 ]
    lumo daemon set --unbind-now
    expect_done $'true\n'
    [ "$(bindings)" = 0 ]
}

@test "in JSON the result is true" {
    json_of configlumo umount -n vm -c "$container"
    expect_status 0
    expect_json 'd is True'
}

@test "neither name nor uuid" {
    lumo configlumo umount -c "$container"
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Either StorageContainer Name or UUID is required"
}

@test "a container that is not mounted" {
    lumo configlumo umount -n vm -c nonsense
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Failed to find Lumo StorageContainer nonsense"
}

@test "a volume that is not mounted" {
    lumo configlumo umount -n vm -c "$container"
    lumo configlumo umount -n vm -c "$container"
    expect_failure 1 "vm"
}
