#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What the user typed wrongly: status 2, nothing on standard output, and a text that helps.
load helper

setup() {
    host_without_daemon
    export TOVI_OFFLINE=1
}

@test "a missing parameter is named" {
    lumo orkaprovider add --vp-name lab
    expect_failure 2 "vp-url"
}

@test "fault_5 an unknown option is named, with what is near it" {
    lumo orkaprovider add --vp-nam lab --vp-url u
    expect_failure 2 "--vp-nam" "--vp-name"
}

@test "an unknown word is named, with what is near it" {
    lumo orkaprovider ad --vp-name lab --vp-url u
    expect_failure 2 "'ad'" "add"
    lumo storagecontaner load
    expect_failure 2 "storagecontaner" "storagecontainer"
}

@test "a word from further down is shown its path" {
    tovi lumo storagecontainer load
    expect_failure 2 "unknown word 'lumo'; did you mean 'storage internal lumo'?"
    tovi storage checklumos --path x
    expect_failure 2 "'storage internal lumo storagecontainer checklumos'"
}

@test "a global option behind a command is offered too" {
    lumo storagecontainer load --fromat json
    expect_failure 2 "did you mean '--format'?"
}

@test "a number that is none: parameter, value, what is expected" {
    lumo orkaprovider add --vp-name lab --vp-url u --arrayid a --priority many --isactive true
    expect_failure 2 "priority" "many" "whole number"
}

@test "fault_4 a number out of 64 bits is a usage error" {
    lumo orkaprovider add --vp-name lab --vp-url u --arrayid a --priority 9223372036854775808 --isactive true
    expect_failure 2 "priority" "9223372036854775808"
}

@test "a boolean that is none: parameter, value, what is expected" {
    lumo faultInjection enable --enabled maybe
    expect_failure 2 "enabled" "maybe" "true" "false"
}

@test "fault_5 a scalar given twice is refused" {
    lumo orkaprovider add --vp-name lab --vp-name lab2 --vp-url u
    expect_failure 2 "vp-name"
}

@test "a value for a flag is refused" {
    lumo orkacontext set --clear=yes
    expect_failure 2 "clear"
}

@test "an option without its value is refused" {
    lumo orkaprovider add --vp-url u --vp-name
    expect_failure 2 "vp-name"
}

@test "a word that no parameter takes is refused" {
    lumo orkaprovider add --vp-name lab --vp-url u surplus
    expect_failure 2 "surplus"
}

@test "the word after an option is its value, whatever it looks like" {
    lumo orkaprovider add -v lab -U u -a one -p -1 -i true
    expect_done $'Succesfully Added VP with name : lab\n'
}

@test "an unknown format is refused and the known ones are listed" {
    tovi --format jsn storage internal lumo orkaprovider add --vp-name lab --vp-url u
    expect_failure 2 "jsn" "json" "table"
}

@test "usage errors come as an error object in a machine format" {
    json_of orkaprovider add --vp-name lab
    expect_failure 2 '{"error":' 'vp-url'
}

@test "nothing is done on a usage error" {
    lumo orkaprovider add --vp-name lab --vp-url u --bogus
    expect_status 2
    [ ! -e "$TOVI_ROOT/host.db" ]
}
