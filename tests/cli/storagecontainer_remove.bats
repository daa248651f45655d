#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
}

@test "a container is taken off the host" {
    lumo storagecontainer remove --container-id "$container"
    expect_done $'true\n'
    [ ! -e "$TOVI_ROOT/volumes/$container_name" ]
}

@test "other spellings of its id" {
    plain="${container//-/}"
    for spelled in "${container^^}" "$plain" "{$container}"; do
        lumo storagecontainer remove -c "$spelled"
        expect_done $'true\n'
        load_containers
    done
}

@test "a load mounts it again" {
    lumo storagecontainer remove -c "$container"
    json_of storagecontainer load
    expect_json "[c['StorageContainer Id'] for c in d] == ['$container']"
}

@test "in JSON the result is true" {
    json_of storagecontainer remove -c "$container"
    expect_status 0
    expect_json 'd is True'
}

@test "an id that is none, as it was given" {
    lumo storagecontainer remove -c "Not An Id"
    expect_failure 1 "Bad CID : Not An Id"
    lumo storagecontainer remove -c ""
    expect_failure 1 "Bad CID : "
}

@test "a container that is not mounted" {
    lumo storagecontainer remove -c "$container"
    lumo storagecontainer remove -c "$container"
    expect_failure 1 "$container"
}

@test "a container with a mounted config volume stays" {
    lumo configlumo add -n vm -c "$container"
    lumo configlumo mount -n vm -c "$container"
    expect_status 0
    lumo storagecontainer remove -c "$container"
    expect_failure 1 "vm"
    [ -d "$TOVI_ROOT/volumes/$container_name/vm" ]
}

@test "without a daemon it works all the same" {
    host_down
    lumo storagecontainer remove -c "$container"
    expect_status 0
    expect_out $'true\n'
}
