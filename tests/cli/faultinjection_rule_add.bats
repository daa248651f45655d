#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
    lumo faultInjection enable --enabled true
    expect_status 0
}

refused="The injection rule could not be added."

@test "every third operation fails" {
    load_containers # a load with nothing to mount is one query
    lumo faultInjection rule add --fault STORAGE_FAULT --operation queryStorageContainer --frequency 3
    expect_done $'true\n'
    for expected in 0 0 1 0 0 1; do
        lumo storagecontainer load
        expect_status "$expected"
    done
    expect_err_has "STORAGE_FAULT"
}

@test "without an operation the rule is for all for which the fault is legal" {
    load_containers
    lumo faultInjection rule add -f RESOURCE_BUSY -n 1
    expect_done $'true\n'
    load_containers
    lumo configlumo add -n vm -c 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    expect_failure 1 "Failed to create Config-Lumo. " "RESOURCE_BUSY"
}

@test "a fault that is not legal for the operation is refused with its cause" {
    lumo faultInjection rule add -f RESOURCE_BUSY -o queryStorageContainer -n 1
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused" "RESOURCE_BUSY" "queryStorageContainer"
}

@test "a rule of another operation does not touch this one" {
    lumo faultInjection rule add -f STORAGE_FAULT -o createVirtualVolume -n 1
    expect_done $'true\n'
    load_containers
}

@test "a rule by time" {
    lumo faultInjection rule add -f STORAGE_FAULT -o queryStorageContainer -t 1
    expect_done $'true\n'
}

@test "a frequency beside a time of 0" {
    lumo faultInjection rule add -f STORAGE_FAULT -o queryStorageContainer --frequency 1 --time 0
    expect_done $'true\n'
    lumo storagecontainer load
    expect_failure 1 "STORAGE_FAULT"
}

@test "neither a frequency nor a time is refused" {
    for given in "" "--frequency 0 --time 0" "--frequency -1" "--time -5"; do
        # shellcheck disable=SC2086  # words on purpose
        lumo faultInjection rule add -f STORAGE_FAULT $given
        expect_failure 1 "You must specify either a frequency or a maximum time to add a rule."
    done
}

# A refusal carries the result false beside the message.
@test "an unknown fault is refused with its cause" {
    lumo faultInjection rule add -f NO_SUCH_FAULT -n 1
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused" "NO_SUCH_FAULT"
}

@test "an unknown operation is refused with its cause" {
    lumo faultInjection rule add -f STORAGE_FAULT -o noSuchOperation -n 1
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused" "noSuchOperation"
}

@test "a rule that exists is refused" {
    lumo faultInjection rule add -f STORAGE_FAULT -n 5
    lumo faultInjection rule add -f STORAGE_FAULT -n 7
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused" "already"
}

@test "in JSON the result is a boolean" {
    json_of faultInjection rule add -f STORAGE_FAULT -n 5
    expect_status 0
    expect_json 'd is True'
    json_of faultInjection rule add -f STORAGE_FAULT -n 5
    expect_status 1
    expect_json 'd is False'
}

@test "a fault is required" {
    lumo faultInjection rule add -n 5
    expect_failure 2 "fault"
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo faultInjection rule add -f STORAGE_FAULT -n 5
    expect_status 3
    expect_err_has "$refused" "$TOVI_ROOT/run/lumod.sock"
}
