#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Bringing up a host in a box that cannot be brought up.
load helper

@test "what is evaluated fails where lab/up does" {
    for mistake in "--topology $BATS_TEST_TMPDIR/none.json" --root --sideways; do
        status=0
        # shellcheck disable=SC2086
        eval "$("$top/lab/up" $mistake 2>"$err")" || status=$?
        expect_status 1
        grep -q "^lab/up: " "$err"
    done
    [ -z "${TOVI_ROOT:-}" ]
}
