#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What is said of a command, wherever it is said.
load helper

no_manual="a build under sanitizers makes no manual"

setup() {
    host_without_daemon
    export TOVI_OFFLINE=1
}

@test "declaration, help, manual and completion say the same of every command" {
    needs_no_sanitizer "$no_manual"
    run -0 python3 "$BATS_TEST_DIRNAME/check_drift.py" "$TOVI_BUILD_DIR/share/man/man1"
}

@test "a page that says something else is noticed" {
    needs_no_sanitizer "$no_manual"
    cp -r "$TOVI_BUILD_DIR/share/man/man1" "$BATS_TEST_TMPDIR/man1"
    page="$BATS_TEST_TMPDIR/man1/tovicli-storage-internal-lumo-orkaprovider-add.1"
    sed -i 's/\\-\\-vp\\-url/\\-\\-vp\\-uri/' "$page"
    run -1 python3 "$BATS_TEST_DIRNAME/check_drift.py" "$BATS_TEST_TMPDIR/man1"
    [[ "$output" == *"orkaprovider add: options in the manual: "* ]]
    rm "$page"
    run ! python3 "$BATS_TEST_DIRNAME/check_drift.py" "$BATS_TEST_TMPDIR/man1"
}

@test "--help stands at every level" {
    words=()
    for word in storage internal lumo storagecontainer; do
        words+=("$word")
        tovi "${words[@]}" --help
        expect_status 0
        cp "$out" "$BATS_TEST_TMPDIR/with"
        tovi "${words[@]}"
        expect_status 0
        cmp "$out" "$BATS_TEST_TMPDIR/with"
    done
    expect_out_has "load        Load All the Lumo StorageContainers exported by the VP."
    tovi -h storage internal lumo storagecontainer load
    expect_status 0
    expect_out_has "Usage:" "Result: a list, each element with the fields:" "    PEInfo " "Examples:" "Exit status:"
}
