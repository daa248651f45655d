#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
}

@test "on and off" {
    lumo faultInjection enable --enabled true
    expect_done $'true\n'
    lumo faultInjection enable -e FALSE
    expect_done $'true\n'
}

@test "rules fire only while it is on" {
    lumo faultInjection rule add --fault STORAGE_FAULT --operation queryStorageContainer --frequency 1
    expect_done $'true\n'
    lumo storagecontainer load
    expect_status 0
    lumo faultInjection enable --enabled true
    expect_done $'true\n'
    lumo storagecontainer load
    expect_failure 1 "Unable to load Lumo datastores: " "STORAGE_FAULT"
    lumo faultInjection enable --enabled false
    lumo storagecontainer load
    expect_status 0
}

@test "in JSON the result is true" {
    json_of faultInjection enable --enabled true
    expect_status 0
    expect_json 'd is True'
}

@test "a value is required" {
    lumo faultInjection enable
    expect_failure 2 "enabled"
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo faultInjection enable --enabled true
    expect_failure 3 "Failed to change the fault injection status." "$TOVI_ROOT/run/lumod.sock"
}
