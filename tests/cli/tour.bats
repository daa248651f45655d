#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# The tour is run as it is written: its commands, and what it shows of their output.
load helper

teardown() {
    # A tour that ended half-way has left its host in a box up.
    for root in "$BATS_TEST_TMPDIR"/tovi-lab.*; do
        [ ! -d "$root" ] || "$top/lab/down" --root "$root"
    done
}

@test "docs/tour.md" {
    cd "$top"
    export TMPDIR="$BATS_TEST_TMPDIR"
    python3 "$BATS_TEST_DIRNAME/run_tour.py" docs/tour.md 3>&- >&2
    run ! compgen -G "$BATS_TEST_TMPDIR/tovi-lab.*"
}

@test "every command is in the tour" {
    host_without_daemon
    tovi --format json cli command list
    expect_json 'len(d) > 20'
    json_value '"\n".join(c["Path"] for c in d)' >"$BATS_TEST_TMPDIR/commands"
    while read -r command; do
        grep -qF "$command" "$top/docs/tour.md" || {
            echo "the tour does not show: $command" >&2
            return 1
        }
    done <"$BATS_TEST_TMPDIR/commands"
}
