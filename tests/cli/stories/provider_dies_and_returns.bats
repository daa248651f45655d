#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# A provider goes away under a host that uses it, and comes back. The host says so while it lasts, loses nothing, and needs
# no help to go on.
load ../helper

@test "a dead provider and its return" {
    mounted_host
    path="$TOVI_ROOT/volumes/$container_name"
    array_file="$LUMO_ARRAY_FILE"
    lumo configlumo add -n vm -c "$container"
    expect_status 0
    uuid="$(volume_uuid vm)"
    lumo configlumo mount -n vm -c "$container"
    expect_status 0
    echo content >"$path/vm/file"

    mv "$array_file" "$array_file.away"

    lumo storagecontainer load
    [ "$status" -ne 0 ]
    expect_out ""
    expect_err_has "Unable to load Lumo datastores: " "$array_file"
    json_of storagecontainer checklumos -p "$path" -v "$uuid"
    expect_status 0
    expect_json '[row["Status"] for row in d] == ["unconfirmed"]'
    lumo configlumo add -n other -c "$container"
    expect_failure 1 "Failed to create Config-Lumo. " "$array_file"
    [ ! -e "$array_file" ]
    [ "$(cat "$path/vm/file")" = content ]

    mv "$array_file.away" "$array_file"

    json_of storagecontainer checklumos -p "$path" -v "$uuid"
    expect_json '[row["Status"] for row in d] == ["accessible"]'
    lumo configlumo add -n other -c "$container"
    expect_done $'true\n'
    lumo configlumo umount -n vm -c "$container"
    expect_done $'true\n'
    lumo storagecontainer load
    expect_status 0
}

@test "of two providers one is dead: what the other exports can be used" {
    mounted_host
    lumo orkaprovider add --vp-name dead --vp-url "file://$TOVI_ROOT/arrays/dead.array"
    expect_status 0
    lumo configlumo add -n vm -c "$container"
    expect_done $'true\n'
    lumo configlumo mount -n vm -c "$container"
    expect_done $'true\n'
}
