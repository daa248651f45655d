#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    lumo configlumo add -n vm -c "$container"
    expect_status 0
    directory="$TOVI_ROOT/volumes/$container_name/vm"
}

bound_to() {
    sqlite3 "$LUMO_ARRAY_FILE" "SELECT e.uid FROM volume v JOIN endpoint e ON v.bound_to = e.seq
        WHERE v.directory_name = '$1'"
}

@test "by name" {
    lumo configlumo mount --name vm --container-id "$container"
    expect_done $'true\n'
    [ -d "$directory" ]
    [ -n "$(bound_to vm)" ]
}

@test "by uuid, which counts when both are given" {
    lumo configlumo mount -u "$(volume_uuid vm)" -n nonsense -c "$container"
    expect_done $'true\n'
    [ -d "$directory" ]
}

@test "what was put there is there after unmount and mount" {
    lumo configlumo mount -n vm -c "$container"
    echo content >"$directory/file"
    lumo configlumo umount -n vm -c "$container"
    [ ! -e "$directory" ]
    lumo configlumo mount -n vm -c "$container" --priority
    expect_done $'true\n'
    [ "$(cat "$directory/file")" = content ]
}

@test "in JSON the result is true" {
    json_of configlumo mount -n vm -c "$container"
    expect_status 0
    expect_json 'd is True'
}

@test "neither name nor uuid" {
    lumo configlumo mount -c "$container"
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Either name or uuid is required"
}

@test "a container that is not mounted" {
    lumo configlumo mount -n vm -c nonsense
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Failed to find Lumo StorageContainer nonsense"
}

@test "a volume that does not exist" {
    lumo configlumo mount -n other -c "$container"
    expect_failure 1 "other"
    lumo configlumo mount -u 00000000-0000-0000-0000-000000000000 -c "$container"
    expect_failure 1 "00000000-0000-0000-0000-000000000000"
}

@test "fault_53 a name that leads out of the container" {
    mkdir "$TOVI_ROOT/outside"
    lumo configlumo mount -n ../../outside -c "$container"
    [ "$status" -eq 1 ]
    expect_out ""
}

@test "something else in the directory's place" {
    echo mine >"$directory"
    lumo configlumo mount -n vm -c "$container"
    [ "$status" -eq 1 ]
    expect_out ""
    [ "$(cat "$directory")" = mine ]
}

@test "fault_54 a symbolic link in the container's place" {
    mkdir "$BATS_TEST_TMPDIR/elsewhere"
    rmdir "$TOVI_ROOT/volumes/$container_name"
    ln -s "$BATS_TEST_TMPDIR/elsewhere" "$TOVI_ROOT/volumes/$container_name"
    lumo configlumo mount -n vm -c "$container"
    [ "$status" -eq 1 ]
    [ -z "$(ls -A "$BATS_TEST_TMPDIR/elsewhere")" ]
}

@test "with all paths down it cannot be mounted" {
    for uid in $(all_endpoints); do
        lumo daemon set --start-pe-apd "$uid"
    done
    lumo configlumo mount -n vm -c "$container"
    expect_failure 1 "endpoint"
    [ ! -e "$directory" ]
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo configlumo mount -n vm -c "$container"
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
    [ ! -e "$directory" ]
}
