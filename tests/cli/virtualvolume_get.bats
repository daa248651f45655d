#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    lumo configlumo add -n vm -c "$container" -s 128 -p gold
    expect_status 0
    uuid="$(volume_uuid vm)"
}

fields='["Container Id", "Lumo UUID", "Logical Size", "Committed Size", "Unshared Size Valid", "Unshared Size", "Storage Profile", "Block Size"]'

@test "what the array tells of a volume" {
    json_of virtualvolume get --container-id "$container" --uuid "$uuid"
    expect_status 0
    expect_json "list(d) == $fields"
    expect_json "(d['Container Id'], d['Lumo UUID'], d['Logical Size'], d['Storage Profile']) == ('$container', '$uuid', 128, 'gold;alloctype=thin')"
    expect_json "type(d['Unshared Size Valid']) is bool and d['Block Size'] > 0"
}

@test "an unshared size that the array cannot tell is left out, or null" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE volume SET unshared_mb = NULL WHERE uuid = '$uuid'"
    json_of virtualvolume get -c "$container" -u "$uuid"
    expect_status 0
    expect_json "d['Unshared Size Valid'] is False and d['Unshared Size'] is None"
    lumo virtualvolume get -c "$container" -u "$uuid"
    expect_status 0
    [ "$(grep -c 'Unshared Size' "$out")" -eq 1 ]
}

@test "a volume without a profile has a block size" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE volume SET profile = NULL WHERE uuid = '$uuid'"
    json_of virtualvolume get -c "$container" -u "$uuid"
    expect_status 0
    expect_json "d['Storage Profile'] is None and d['Block Size'] > 0"
}

@test "for people: one field a line, sizes with their unit" {
    lumo virtualvolume get -c "$container" -u "$uuid"
    expect_status 0
    expect_err ""
    expect_out_has "Container Id: $container" "Lumo UUID: $uuid" "Logical Size: 128 MB" "Storage Profile: gold"
}

@test "an id in another spelling is shown in its canonical form" {
    json_of virtualvolume get -c "{${container^^}}" -u "$uuid"
    expect_status 0
    expect_json "d['Container Id'] == '$container'"
}

@test "an id that is none comes before an empty uuid" {
    lumo virtualvolume get -c nonsense -u ""
    expect_failure 1 "Container Id is not valid."
}

@test "an empty uuid" {
    lumo virtualvolume get -c "$container" -u ""
    expect_failure 1 "Lumo UUID cannot be empty."
}

@test "a volume that does not exist" {
    lumo virtualvolume get -c "$container" -u 00000000-0000-0000-0000-000000000000
    expect_failure 1 "Failed to get space stats for Lumo." "00000000-0000-0000-0000-000000000000"
}

@test "a failure on the way is the whole answer" {
    lumo faultInjection enable -e true
    lumo faultInjection rule add -f STORAGE_FAULT -o unsharedChunksVirtualVolume -n 1
    lumo virtualvolume get -c "$container" -u "$uuid"
    expect_failure 1 "Failed to get block size for Lumo." "STORAGE_FAULT"
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo virtualvolume get -c "$container" -u "$uuid"
    expect_failure 3 "Failed to get space stats for Lumo. no daemon answers at $TOVI_ROOT/run/lumod.sock"
}
