#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What the tool does while the daemon is away.
load helper

setup() {
    host_without_daemon
    socket="$TOVI_ROOT/run/lumod.sock"
}

# expect_warning_once: the one line that names the socket, and no second one.
expect_warning_once() {
    [ "$(grep -cF "$socket" "$err")" -eq 1 ] || mismatch "exactly one line that names $socket"
}

@test "fault_33 help works and warns in one line that names the socket" {
    tovi storage internal lumo storagecontainer load --help
    expect_status 0
    expect_out_has "Load All the Lumo StorageContainers exported by the VP."
}

@test "a namespace alone lists what it holds" {
    lumo orkaprovider
    expect_out_has "activate" "injectfault" "Add a new Orka Provider on the host."
}

@test "a provider can be registered" {
    lumo orkaprovider add --vp-name lab --vp-url u
    expect_status 0
    expect_out $'Succesfully Added VP with name : lab\n'
    expect_warning_once
}

@test "the context can be set" {
    lumo orkacontext set --uuid 11111111-2222-3333-4444-555555555555
    expect_status 0
    expect_out $'true\n'
}

@test "fault_33 a command that needs the daemon fails at once with status 3, its cause and the socket" {
    started=$EPOCHREALTIME
    lumo storagecontainer load
    [ "$(((${EPOCHREALTIME/./} - ${started/./}) / 1000))" -lt 2000 ]
    expect_failure 3 "Unable to load Lumo datastores: no daemon answers at $socket"
}

@test "each command that asks the daemon ends with status 3" {
    for command in \
        "orkaprovider activate -n lab -a one" \
        "orkaprovider deactivate -n lab -a one" \
        "faultInjection enable --enabled true" \
        "faultInjection rule add --fault STORAGE_FAULT --frequency 1" \
        "faultInjection rule set --fault STORAGE_FAULT --frequency 1" \
        "faultInjection rule remove --fault STORAGE_FAULT" \
        "daemon set --log-level info" \
        "virtualvolume get -c 11111111-2222-3333-4444-555555555555 -u 11111111-2222-3333-4444-555555555556" \
        "virtualvolume metadata list -c 11111111-2222-3333-4444-555555555555 -u 11111111-2222-3333-4444-555555555556"; do
        # shellcheck disable=SC2086  # words on purpose
        lumo $command
        echo "$command" >&2
        expect_status 3
        expect_err_has "$socket"
    done
}

@test "in a machine format the failure is an error object and standard output stays empty" {
    json_of storagecontainer load
    expect_failure 3 '{"error":' 'Unable to load Lumo datastores: '
}

@test "the socket is named under the root of the option, before that of the environment" {
    other="$BATS_TEST_TMPDIR/other"
    mkdir "$other"
    tovi --root "$other" storage internal lumo storagecontainer load
    expect_failure 3 "$other/run/lumod.sock"
}

@test "TOVI_OFFLINE: no warning, and requests fail all the same" {
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name lab --vp-url u
    expect_done $'Succesfully Added VP with name : lab\n'
    lumo storagecontainer load
    expect_failure 3 "Unable to load Lumo datastores: "
}

@test "fault_33 a socket that nobody listens on is the same as none" {
    mkdir -p "$TOVI_ROOT/run"
    python3 -c 'import socket, sys; socket.socket(socket.AF_UNIX).bind(sys.argv[1])' "$socket"
    lumo storagecontainer load
    expect_failure 3 "$socket"
}
