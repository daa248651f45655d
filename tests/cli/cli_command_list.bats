#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Which commands there are.
load helper

setup() {
    host_without_daemon
}

@test "every command is listed with its plug-in, in the order of help" {
    tovi --format json cli command list
    expect_status 0
    expect_err ""
    expect_json 'len([c for c in d if c["Plugin"] == "liblumointernal.so"]) == 22'
    expect_json 'd[0] == {"Path": "storage internal lumo orkaprovider add", "Description": "Add a new Orka Provider on the host.", "Plugin": "liblumointernal.so"}'
    expect_json '[c["Path"] for c in d if c["Plugin"] is None] == ["cli command list", "cli describe", "cli plugin list", "cli plugin check", "cli completion", "cli doctor", "cli shell"]'
}

@test "what completion asks is nobody else's business: no list, no help, no suggestion names it" {
    tovi cli command list
    run ! grep -q "cli complete " "$out"
    tovi cli
    expect_out_has "completion"
    run ! grep -qw "complete" "$out"
}

@test "the commands are found through the path that they are listed with" {
    tovi --format json cli command list
    json_value '"\n".join(c["Path"] for c in d)' >"$BATS_TEST_TMPDIR/paths"
    while read -r path; do
        # shellcheck disable=SC2086  # words on purpose
        tovi $path --help
        expect_status 0
        expect_out_has "tovicli $path"
    done <"$BATS_TEST_TMPDIR/paths"
}

@test "no other command loads the library of these, nor what it needs" {
    for command in "--version" "--help" "storage internal lumo orkacontext set --clear"; do
        # shellcheck disable=SC2086  # words on purpose
        traced -f -e trace=openat -o "$BATS_TEST_TMPDIR/opened" tovicli $command >/dev/null 2>&1
        grep -q libplexa "$BATS_TEST_TMPDIR/opened"
        run ! grep -E "libtovicli-|libedit|libtinfo|libbsd" "$BATS_TEST_TMPDIR/opened"
    done
    readelf -d "$TOVI_BUILD_DIR/bin/tovicli" >"$BATS_TEST_TMPDIR/needed"
    run ! grep -E "NEEDED.*(tovicli-|edit|tinfo|readline|sqlite)" "$BATS_TEST_TMPDIR/needed"
}

@test "the library of line editing is loaded by a shell on a terminal only" {
    traced -f -e trace=openat -o "$BATS_TEST_TMPDIR/opened" tovicli cli shell </dev/null
    grep -q libtovicli-cli "$BATS_TEST_TMPDIR/opened"
    run ! grep -E "libtovicli-lines|libedit" "$BATS_TEST_TMPDIR/opened"
}

@test "without the library its commands are not to be had, and others work" {
    mkdir -p "$BATS_TEST_TMPDIR/install/bin" "$BATS_TEST_TMPDIR/install/lib/tovicli"
    cp "$TOVI_BUILD_DIR/bin/tovicli" "$BATS_TEST_TMPDIR/install/bin/"
    cp -P "$TOVI_BUILD_DIR"/lib/lib*.so* "$BATS_TEST_TMPDIR/install/lib/"
    cp -r "$TOVI_BUILD_DIR/lib/tovicli/plugins" "$BATS_TEST_TMPDIR/install/lib/tovicli/"
    PATH="$BATS_TEST_TMPDIR/install/bin:$PATH"
    tovi cli command list
    expect_failure 3 "the commands of 'cli' cannot be loaded: " "libtovicli-cli.so"
    lumo orkacontext set --clear
    expect_status 0
}
