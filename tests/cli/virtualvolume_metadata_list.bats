#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    lumo configlumo add -n vm -c "$container"
    expect_status 0
    uuid="$(volume_uuid vm)"
    metadata
}

# metadata [KEY VALUE]...: gives the volume exactly these pairs.
metadata() {
    local position=0
    sqlite3 "$LUMO_ARRAY_FILE" "DELETE FROM metadata WHERE volume = (SELECT seq FROM volume WHERE uuid = '$uuid')"
    while [ $# -gt 0 ]; do
        sqlite3 "$LUMO_ARRAY_FILE" "INSERT INTO metadata SELECT seq, $((position++)), '$1', '$2' FROM volume
            WHERE uuid = '$uuid'"
        shift 2
    done
}

@test "pairs in the array's order, doubles included" {
    metadata b 1 a 2 b 1
    json_of virtualvolume metadata list --container-id "$container" --uuid "$uuid"
    expect_status 0
    expect_json "d == [{'key': 'b', 'value': '1'}, {'key': 'a', 'value': '2'}, {'key': 'b', 'value': '1'}]"
}

@test "a volume without metadata" {
    json_of virtualvolume metadata list -c "$container" -u "$uuid"
    expect_status 0
    expect_json "d == []"
    lumo virtualvolume metadata list -c "$container" -u "$uuid"
    expect_status 0
    expect_err ""
}

@test "a table, one row a pair" {
    metadata colour red
    lumo virtualvolume metadata list -c "$container" -u "$uuid"
    expect_status 0
    expect_err ""
    expect_out_has "key" "value" "colour" "red"
}

@test "fault_64 what a terminal would obey is shown, not sent" {
    metadata $'\e[31mred' $'\r\xe2\x80\xaeback'
    lumo virtualvolume metadata list -c "$container" -u "$uuid"
    expect_status 0
    [ "$(LC_ALL=C tr -d '\n[:print:]' <"$out" | LC_ALL=C grep -c $'[\x1b\r\x80-\xff]')" = 0 ]
    json_of virtualvolume metadata list -c "$container" -u "$uuid"
    expect_json "d == [{'key': '\x1b[31mred', 'value': '\r\u202eback'}]"
}

@test "an id that is none comes before an empty uuid" {
    lumo virtualvolume metadata list -c nonsense -u ""
    expect_failure 1 "Container Id is not valid."
}

@test "an empty uuid" {
    lumo virtualvolume metadata list -c "$container" -u ""
    expect_failure 1 "Lumo UUID cannot be empty."
}

@test "a volume that does not exist" {
    lumo virtualvolume metadata list -c "$container" -u 00000000-0000-0000-0000-000000000000
    expect_failure 1 "Failed to get the metadata for Lumo."
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo virtualvolume metadata list -c "$container" -u "$uuid"
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
}
