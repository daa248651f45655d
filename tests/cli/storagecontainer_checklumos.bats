#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
    path="$TOVI_ROOT/volumes/$container_name"
    for name in one two; do
        lumo configlumo add -n "$name" -c "$container"
        expect_status 0
    done
    one="$(volume_uuid one)"
    two="$(volume_uuid two)"
}

# statuses: "id status" lines of the JSON result, in its order.
statuses() {
    json_value '"\n".join(row["LumoId"] + " " + str(row["Status"]) for row in d)'
}

@test "given volumes, in the order given, twice when given twice" {
    json_of storagecontainer checklumos --path "$path" --lumo "$two" --lumo "$one" -v "$two"
    expect_status 0
    [ "$(statuses)" = "$two accessible
$one accessible
$two accessible" ]
}

@test "a volume that the array does not know" {
    json_of storagecontainer checklumos -p "$path" -v 00000000-0000-0000-0000-000000000000
    expect_status 0
    [ "$(statuses)" = "00000000-0000-0000-0000-000000000000 non-existent" ]
}

@test "without any given: every config volume of the container" {
    json_of storagecontainer checklumos -p "$path"
    expect_status 0
    expect_json "{'$one', '$two'} <= {row['LumoId'] for row in d}"
}

@test "a table" {
    lumo storagecontainer checklumos -p "$path" -v "$one"
    expect_status 0
    expect_err ""
    expect_out_has "LumoId" "Status" "$one" "accessible"
}

@test "with all paths down the volumes are inaccessible" {
    for uid in $(all_endpoints); do
        lumo daemon set --start-pe-apd "$uid"
    done
    json_of storagecontainer checklumos -p "$path" -v "$one"
    expect_status 0
    [ "$(statuses)" = "$one inaccessible" ]
}

@test "an unknown path" {
    lumo storagecontainer checklumos -p /nowhere
    expect_failure 1 "Bad datastore path"
}

@test "while the daemon is away nothing can be confirmed" {
    host_down
    json_of storagecontainer checklumos -p "$path" -v "$one"
    expect_status 0
    [ "$(statuses)" = "$one unconfirmed" ]
}

@test "a path is required" {
    lumo storagecontainer checklumos
    expect_failure 2 "path"
}
