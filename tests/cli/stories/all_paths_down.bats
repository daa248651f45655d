#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Every path to an array goes down and comes back. Its volumes are inaccessible in between, also across a restart of the
# daemon, since an outage belongs to the host.
load ../helper

statuses() {
    json_of storagecontainer checklumos -p "$path" -v "$uuid"
    expect_status 0
    json_value '[row["Status"] for row in d]'
}

@test "all paths down and back" {
    mounted_host
    path="$TOVI_ROOT/volumes/$container_name"
    lumo configlumo add -n vm -c "$container"
    uuid="$(volume_uuid vm)"
    [ "$(statuses)" = "['accessible']" ]

    for uid in $(all_endpoints); do
        lumo daemon set --start-pe-apd "$uid"
        expect_status 1
        expect_err_has "Notify PE APD command returned containers: "
    done
    [ "$(statuses)" = "['inaccessible']" ]
    lumo configlumo mount -n vm -c "$container"
    expect_failure 1 "endpoint"

    host_down
    host_up
    [ "$(statuses)" = "['inaccessible']" ]

    for uid in $(all_endpoints); do
        lumo daemon set --end-pe-apd "$uid"
    done
    [ "$(statuses)" = "['accessible']" ]
    lumo configlumo mount -n vm -c "$container"
    expect_done $'true\n'
}

@test "a volume follows the endpoint that it is bound through" {
    mounted_host
    path="$TOVI_ROOT/volumes/$container_name"
    lumo configlumo add -n vm -c "$container"
    lumo configlumo mount -n vm -c "$container"
    expect_status 0
    uuid="$(volume_uuid vm)"
    bound="$(sqlite3 "$LUMO_ARRAY_FILE" "SELECT e.uid FROM volume v JOIN endpoint e ON v.bound_to = e.seq
        WHERE v.uuid = '$uuid'")"
    lumo daemon set --start-pe-apd "$bound"
    [ "$(statuses)" = "['inaccessible']" ]
    lumo daemon set --end-pe-apd "$bound"
    [ "$(statuses)" = "['accessible']" ]
}
