#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# A provider refuses a creation. The user reads why, nothing half-made stays behind, and the same command succeeds later.
load ../helper

@test "a refused creation leaves nothing, and succeeds when the fault is gone" {
    mounted_host
    lumo faultInjection enable --enabled true
    lumo faultInjection rule add --fault OUT_OF_RESOURCE --operation createVirtualVolume --frequency 1
    expect_done $'true\n'

    lumo configlumo add -n vm -c "$container"
    expect_failure 1 "Failed to create Config-Lumo. " "OUT_OF_RESOURCE"
    [ -z "$(volume_uuid vm)" ]
    lumo configlumo mount -n vm -c "$container"
    expect_failure 1 "vm"

    lumo faultInjection rule remove --fault OUT_OF_RESOURCE --operation createVirtualVolume
    lumo configlumo add -n vm -c "$container"
    expect_done $'true\n'
}

@test "every second deletion fails: the volume is whole, and the repetition deletes it" {
    mounted_host
    for name in one two; do
        lumo configlumo add -n "$name" -c "$container"
        lumo configlumo mount -n "$name" -c "$container"
        expect_status 0
        echo "$name" >"$TOVI_ROOT/volumes/$container_name/$name/file"
    done
    lumo faultInjection enable -e true
    lumo faultInjection rule add -f STORAGE_FAULT -o deleteVirtualVolume -n 2
    lumo configlumo remove -n one -c "$container"
    expect_done $'true\n'
    lumo configlumo remove -n two -c "$container"
    expect_failure 1 "STORAGE_FAULT"
    [ -n "$(volume_uuid two)" ]

    lumo configlumo remove -n two -c "$container"
    expect_done $'true\n'
    [ -z "$(volume_uuid two)" ]
}
