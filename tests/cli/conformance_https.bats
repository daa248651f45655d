#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# orka-conformance on the array simulator, over HTTPS.
load helper

setup() {
    array_in_memory
}

teardown() {
    serve_no_more
    rm -rf "$place"
}

# serve OPTIONS...: the array over HTTPS, its certificate pinned in $place/certs.
serve() {
    serve_array "$place/test.array" "$@"
    pin_certificate "$place/certs"
}

# conformance ARGS...: runs the program on the server; leaves $status, $out and $err.
conformance() {
    status=0
    orka-conformance --certs "$place/certs" "$@" "$url" >"$out" 2>"$err" </dev/null || status=$?
}

@test "every case passes over HTTPS" {
    serve
    conformance
    expect_status 0
    expect_out_has " 0 failed"
    expect_err ""
}

@test "a bug is found over HTTPS too" {
    serve
    conformance --bug looks-then-makes --only concurrency/create/two
    expect_status 1
    expect_out_has "came     a second one did"
}

@test "a simulator's bug is found from the other side" {
    serve --bug stats-in-bytes
    conformance --only 'volume/space-stats/*'
    expect_status 1
    expect_out_has "FAILED   volume/space-stats/agree-with-facts"
}

@test "what a provider refuses now and then is tried again, and nothing stays" {
    serve --error-rate 20 --seed 3
    conformance --only 'volume/query*/*' --only 'idempotency/create/*' --only 'residue/*'
    expect_status 0
    expect_out_has " 0 failed"
}

@test "a server whose certificate nobody trusts is not reached" {
    serve
    rm -r "$place/certs"
    conformance
    expect_failure 3 "the provider cannot be reached"
}
