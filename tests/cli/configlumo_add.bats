#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
}

# column_of COLUMN DIRECTORY: what the array keeps of the volume.
column_of() {
    sqlite3 "$LUMO_ARRAY_FILE" "SELECT coalesce($1, 'NULL') FROM volume WHERE directory_name = '$2'"
}

@test "a config volume is created on the array and not mounted" {
    lumo configlumo add --name vm --container-id "$container"
    expect_done $'true\n'
    [ -n "$(volume_uuid vm)" ]
    [ ! -e "$TOVI_ROOT/volumes/$container_name/vm" ]
}

@test "size, virtual machine and policy reach the array" {
    lumo configlumo add -n vm -c "$container" -s 128 -v 11111111-2222-3333-4444-555555555555 -p gold
    expect_done $'true\n'
    [ "$(column_of size_mb vm)" = 128 ]
    [ "$(column_of vm_uuid vm)" = 11111111-2222-3333-4444-555555555555 ]
    [ "$(column_of profile vm)" = "gold;alloctype=thin" ]
}

@test "of a policy file the first line counts, and the policy parameter does not" {
    printf 'silver\ngold\n' >"$BATS_TEST_TMPDIR/policy"
    lumo configlumo add -n vm -c "$container" -f "$BATS_TEST_TMPDIR/policy" -p bronze
    expect_done $'true\n'
    [ "$(column_of profile vm)" = "silver;alloctype=thin" ]
}

@test "a policy file that is missing is no failure and means no policy" {
    lumo configlumo add -n vm -c "$container" -f "$BATS_TEST_TMPDIR/nowhere" -p bronze
    expect_done $'true\n'
    [[ "$(column_of profile vm)" != *bronze* ]]
}

@test "with priority" {
    lumo configlumo add -n vm -c "$container" --priority
    expect_done $'true\n'
}

@test "an id in another spelling" {
    lumo configlumo add -n vm -c "${container^^}"
    expect_done $'true\n'
}

@test "in JSON the result is true" {
    json_of configlumo add -n vm -c "$container"
    expect_status 0
    expect_json 'd is True'
}

# A result was set beside the message: it is printed, and the status is a failure's.
@test "a container that is not mounted" {
    lumo configlumo add -n vm -c 00000000-0000-0000-0000-000000000000
    expect_status 1
    expect_out $'false\n'
    expect_err_has "Failed to find Lumo StorageContainer 00000000-0000-0000-0000-000000000000"
}

@test "a name that is taken" {
    lumo configlumo add -n vm -c "$container"
    lumo configlumo add -n vm -c "$container"
    expect_failure 1 "Failed to create Config-Lumo. " "vm"
}

@test "fault_53 a name that is no directory name" {
    for name in . .. a/b "" $'a\nb' "$(printf 'x%.0s' {1..256})"; do
        lumo configlumo add -n "$name" -c "$container"
        expect_failure 1 "Failed to create Config-Lumo. "
    done
}

@test "fault_55 names that only look alike are two" {
    lumo configlumo add -n $'caf\xc3\xa9' -c "$container"
    lumo configlumo add -n $'cafe\xcc\x81' -c "$container"
    expect_done $'true\n'
}

@test "a size that the container does not allow" {
    lumo configlumo add -n vm -c "$container" -s 9223372036854775807
    expect_failure 1 "Failed to create Config-Lumo. "
    lumo configlumo add -n vm -c "$container" -s -1
    expect_failure 1 "Failed to create Config-Lumo. "
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo configlumo add -n vm -c "$container"
    expect_failure 3 "Failed to create Config-Lumo. " "$TOVI_ROOT/run/lumod.sock"
}
