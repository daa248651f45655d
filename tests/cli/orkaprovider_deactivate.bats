#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
}

prefix="LumoLib_DeactivateProvider failed with error "

@test "the array is no longer served" {
    lumo orkaprovider deactivate --vp-name lab --arrayid "$array"
    expect_done $'true\n'
    lumo configlumo add --name vm --container-id "$container"
    expect_failure 1 "Failed to create Config-Lumo. " "active provider"
}

@test "another provider of the same array takes over" {
    lumo orkaprovider add --vp-name second --vp-url "$LUMO_ARRAY_URL"
    expect_status 0
    lumo orkaprovider deactivate -n lab -a "$array"
    expect_done $'true\n'
    lumo configlumo add --name vm --container-id "$container"
    expect_done $'true\n'
}

@test "in JSON the result is true" {
    json_of orkaprovider deactivate --vp-name lab --arrayid "$array"
    expect_status 0
    expect_json 'd is True'
}

@test "an unknown provider" {
    lumo orkaprovider deactivate --vp-name other --arrayid "$array"
    expect_failure 1 "${prefix}no such provider"
}

@test "an unknown array" {
    lumo orkaprovider deactivate --vp-name lab --arrayid nowhere
    expect_failure 1 "${prefix}no such storage array"
}

@test "a restart forgets it" {
    lumo orkaprovider deactivate --vp-name lab --arrayid "$array"
    host_down
    host_up
    lumo configlumo add --name vm --container-id "$container"
    expect_done $'true\n'
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo orkaprovider deactivate --vp-name lab --arrayid "$array"
    expect_failure 3 "${prefix}the daemon is not running" "$TOVI_ROOT/run/lumod.sock"
}
