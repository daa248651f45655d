#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
}

prefix="LumoLib_ActivateProvider failed with error "

@test "a provider is made the active one" {
    lumo orkaprovider activate --vp-name lab --arrayid "$array"
    expect_done $'true\n'
    lumo orkaprovider activate -n lab -a "$array" -u "$LUMO_ARRAY_URL"
    expect_done $'true\n'
}

@test "what was deactivated serves its array again" {
    lumo orkaprovider deactivate --vp-name lab --arrayid "$array"
    lumo storagecontainer checklumos --path "$TOVI_ROOT/volumes/$container_name"
    lumo orkaprovider activate --vp-name lab --arrayid "$array"
    expect_done $'true\n'
    lumo configlumo add --name vm --container-id "$container"
    expect_done $'true\n'
}

@test "in JSON the result is true" {
    json_of orkaprovider activate --vp-name lab --arrayid "$array"
    expect_status 0
    expect_json 'd is True'
}

@test "an unknown provider" {
    lumo orkaprovider activate --vp-name other --arrayid "$array"
    expect_failure 1 "${prefix}no such provider"
}

@test "an unknown array" {
    lumo orkaprovider activate --vp-name lab --arrayid nowhere
    expect_failure 1 "${prefix}no such storage array"
}

@test "another active provider than the one expected" {
    lumo orkaprovider activate --vp-name lab --arrayid "$array" --activevpurl file:///other.array
    expect_failure 1 "${prefix}another provider is active for the array"
}

@test "a parameter is missing" {
    lumo orkaprovider activate --vp-name lab
    expect_failure 2 "arrayid"
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo orkaprovider activate --vp-name lab --arrayid "$array"
    expect_failure 3 "${prefix}the daemon is not running" "$TOVI_ROOT/run/lumod.sock"
}
