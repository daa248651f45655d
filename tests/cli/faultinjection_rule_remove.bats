#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
    lumo faultInjection enable --enabled true
    expect_status 0
}

refused="The injection rule could not be removed."

@test "a rule that was removed does not fire" {
    lumo faultInjection rule add -f STORAGE_FAULT -o queryStorageContainer -n 1
    lumo storagecontainer load
    expect_status 1
    lumo faultInjection rule remove --fault STORAGE_FAULT --operation queryStorageContainer
    expect_done $'true\n'
    load_containers
}

@test "without an operation the rule for all of them is removed" {
    lumo faultInjection rule add -f STORAGE_FAULT -n 1
    lumo faultInjection rule remove -f STORAGE_FAULT
    expect_done $'true\n'
    load_containers
}

@test "a rule that does not exist is refused" {
    lumo faultInjection rule remove -f STORAGE_FAULT
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused"
}

@test "in JSON the result is a boolean" {
    json_of faultInjection rule remove -f STORAGE_FAULT
    expect_status 1
    expect_json 'd is False'
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo faultInjection rule remove -f STORAGE_FAULT
    expect_status 3
    expect_err_has "$refused" "$TOVI_ROOT/run/lumod.sock"
}
