#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
}

@test "the record is gone, and its containers with it" {
    lumo orkaprovider remove --vp-name lab
    expect_done $'true\n'
    [ "$(stored_providers)" = "" ]
    json_of storagecontainer load
    expect_status 0
    expect_json 'd == []'
}

@test "what is mounted stays mounted" {
    load_containers
    ls "$TOVI_ROOT/volumes" >"$BATS_TEST_TMPDIR/before"
    [ -s "$BATS_TEST_TMPDIR/before" ]
    lumo orkaprovider remove -v lab
    expect_done $'true\n'
    ls "$TOVI_ROOT/volumes" | cmp - "$BATS_TEST_TMPDIR/before"
}

@test "a name that was removed can be added again" {
    lumo orkaprovider remove --vp-name lab
    expect_status 0
    register_provider
    load_containers
}

@test "in JSON the result is true" {
    json_of orkaprovider remove --vp-name lab
    expect_status 0
    expect_json 'd is True'
}

@test "an unknown name is refused by name" {
    lumo orkaprovider remove --vp-name other
    expect_failure 1 "other"
    [ "$(stored_providers)" != "" ]
}

@test "an empty name is refused" {
    lumo orkaprovider remove --vp-name ""
    [ "$status" -eq 1 ]
    expect_out ""
    [ -s "$err" ]
}

@test "without a daemon the record is removed all the same" {
    host_down
    lumo orkaprovider remove --vp-name lab
    expect_status 0
    expect_out $'true\n'
    [ "$(stored_providers)" = "" ]
}
