#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
    lumo faultInjection enable --enabled true
    lumo faultInjection rule add -f STORAGE_FAULT -o queryStorageContainer -n 1000000
    expect_status 0
}

refused="The injection rule could not be modified.  Verify that the rule exists."

@test "the rule fires as it was set last" {
    load_containers
    lumo faultInjection rule set --fault STORAGE_FAULT --operation queryStorageContainer --frequency 1
    expect_done $'true\n'
    lumo storagecontainer load
    expect_failure 1 "STORAGE_FAULT"
}

@test "a rule that does not exist is refused" {
    lumo faultInjection rule set -f RESOURCE_BUSY -o queryStorageContainer -n 1
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused"
}

@test "the rule for all operations is another one" {
    lumo faultInjection rule set -f STORAGE_FAULT -n 1
    expect_status 1
    expect_out $'false\n'
    expect_err_has "$refused"
}

@test "neither a frequency nor a time is refused" {
    lumo faultInjection rule set -f STORAGE_FAULT -o queryStorageContainer -n 0 -t 0
    expect_failure 1 "You must specify either a frequency or a maximum time to modify a rule."
}

@test "in JSON the result is a boolean" {
    json_of faultInjection rule set -f STORAGE_FAULT -o queryStorageContainer -t 500
    expect_status 0
    expect_json 'd is True'
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo faultInjection rule set -f STORAGE_FAULT -n 5
    expect_status 3
    expect_err_has "$refused" "$TOVI_ROOT/run/lumod.sock"
}
