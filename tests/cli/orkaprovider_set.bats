#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_without_daemon
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name lab --vp-url file:///lab.array --arrayid one --priority 1 --isactive true
    expect_status 0
}

@test "the array list is replaced whole and the URL stays" {
    lumo orkaprovider set --vp-name lab --arrayid two --priority 2 --isactive false --arrayid three --priority 3 --isactive true
    expect_done $'Successfully Updated VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array|two/0/2|three/1/3' ]
}

@test "short names of the parameters" {
    lumo orkaprovider set -v lab -a two -p 2 -i false
    expect_done $'Successfully Updated VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array|two/0/2' ]
}

@test "no array parameters clear the list" {
    lumo orkaprovider set --vp-name lab
    expect_done $'Successfully Updated VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array' ]
}

@test "priorities keep their low 32 bits" {
    lumo orkaprovider set --vp-name lab --arrayid two -p -1 -i true --arrayid three -p 2147483648 -i true
    expect_done $'Successfully Updated VP with name : lab\n'
    [ "$(stored_providers)" = 'lab|file:///lab.array|two/1/-1|three/1/-2147483648' ]
}

@test "in JSON the result is one text" {
    json_of orkaprovider set --vp-name lab
    expect_status 0
    expect_json 'd == "Successfully Updated VP with name : lab\n"'
}

@test "an unknown name is refused" {
    lumo orkaprovider set --vp-name other --arrayid two
    expect_failure 1 "Cannot Update VP as : other does not exist"
}

@test "an empty name is an unknown one" {
    lumo orkaprovider set --vp-name ""
    expect_failure 1 "Cannot Update VP as :  does not exist"
}

@test "lists of different lengths are refused and nothing is written" {
    lumo orkaprovider set --vp-name lab --arrayid two --priority 1
    expect_failure 1 "Missing one of the  parameter arrayIdor priority or isActive for an Array "
    [ "$(stored_providers)" = 'lab|file:///lab.array|one/1/1' ]
}

@test "there is no URL to change" {
    lumo orkaprovider set --vp-name lab --vp-url other
    expect_failure 2 "vp-url"
}
