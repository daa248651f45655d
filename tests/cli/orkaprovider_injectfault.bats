#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
}

done_text=$'Successfully Injected fault for VP with name : lab\n'

# exported: how many containers a load mounts on this host.
exported() {
    json_of storagecontainer load
    expect_status 0
    json_value 'len(d)'
}

@test "an offline provider exports no containers, until the injection is taken back" {
    lumo orkaprovider injectfault --vp-name lab --status offline
    expect_done "$done_text"
    [ "$(exported)" = 0 ]
    lumo orkaprovider injectfault --vp-name lab
    expect_done "$done_text"
    [ "$(exported)" -gt 0 ]
}

@test "volumes of an offline provider cannot be confirmed" {
    json_of storagecontainer load
    container="$(json_value 'd[0]["StorageContainer Id"]')"
    container_name="$(json_value 'd[0]["StorageContainer Name"]')"
    lumo configlumo add -n vm -c "$container"
    expect_status 0
    lumo orkaprovider injectfault -v lab -s offline
    json_of storagecontainer checklumos -p "$TOVI_ROOT/volumes/$container_name" -v "$(volume_uuid vm)"
    expect_status 0
    expect_json '[row["Status"] for row in d] == ["unconfirmed"]'
}

@test "each known status is taken" {
    for word in online offline syncError unknown default; do
        lumo orkaprovider injectfault --vp-name lab --status "$word"
        expect_done "$done_text"
    done
}

@test "an array's active flag" {
    json_of storagecontainer load
    array="$(json_value 'd[0]["Arrays"][0]["ArrayId"]')"
    container="$(json_value 'd[0]["StorageContainer Id"]')"
    lumo orkaprovider injectfault -v lab -a "$array" -i false
    expect_done "$done_text"
    lumo configlumo add -n vm -c "$container"
    expect_failure 1 "Failed to create Config-Lumo. "
    lumo orkaprovider injectfault -v lab -a "$array" -i true
    expect_done "$done_text"
    lumo configlumo add -n vm -c "$container"
    expect_done $'true\n'
}

@test "a status that the daemon does not know" {
    lumo orkaprovider injectfault --vp-name lab --status asleep
    expect_failure 1 "VendorProviderInjectFault failed for VP with name : lab with error: invalid argument" "asleep"
}

@test "an unknown provider" {
    lumo orkaprovider injectfault --vp-name other
    expect_failure 1 "VP : other does not exist"
}

@test "lists of different lengths" {
    lumo orkaprovider injectfault --vp-name lab --arrayid one --arrayid two --isactive true
    expect_failure 1 "Missing one of the parameter arrayId or isActive"
}

@test "in JSON the result is one text" {
    json_of orkaprovider injectfault --vp-name lab
    expect_status 0
    expect_json 'd == "Successfully Injected fault for VP with name : lab\n"'
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo orkaprovider injectfault --vp-name lab
    expect_failure 3 "VendorProviderInjectFault failed for VP with name : lab with error: " "$TOVI_ROOT/run/lumod.sock"
}
