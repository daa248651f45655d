#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# orka-conformance on the array simulator, over HTTPS.
load helper

setup() {
    # Thousands of commits: in memory where there is a place for them.
    memory=/dev/shm
    [ -w "$memory" ] || memory="$BATS_TEST_TMPDIR"
    place="$(mktemp -d -p "$memory")"
    orkasim make "$top/lab/topologies/small.json" "$place/test.array"
}

teardown() {
    if [ -n "${server:-}" ]; then
        kill "$server"
        wait "$server" || true
    fi
    rm -rf "$place"
}

# serve OPTIONS...: leaves $url, and the server's certificate pinned in $place/certs.
serve() {
    mkfifo "$place/url"
    orkasim serve --cert "$place/cert.pem" --key "$place/key.pem" "$@" "$place/test.array" >"$place/url" 2>"$place/log" 3>&- &
    server=$!
    read -r url <"$place/url"
    mkdir "$place/certs"
    local port="${url##*:}"
    cp "$place/cert.pem" "$place/certs/127.0.0.1_${port%%/*}.pem"
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
