#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# Every bug that the simulator can be given, judged over HTTPS. What is listed as hidden there must be, or the list is old.
load helper

setup() {
    memory=/dev/shm
    [ -w "$memory" ] || memory="$BATS_TEST_TMPDIR"
    place="$(mktemp -d -p "$memory")"
    orkasim make "$top/lab/topologies/small.json" "$place/test.array"
    # shellcheck disable=SC2016  # the backquotes are Markdown's
    orka-conformance --list-bugs --format markdown |
        sed -n 's/^| `\(.*\)` | .* | `\(.*\)` | \(yes\|no\).* |$/\1 \2 \3/p' >"$place/bugs"
    [ "$(wc -l <"$place/bugs")" = "$(orka-conformance --list-bugs --format markdown | wc -l)" ]
}

teardown() {
    serve_no_more
    rm -rf "$place"
}

# judge BUG CASE: runs the case on an array that has the bug; leaves $status and $out.
judge() {
    serve_array "$place/test.array" --bug "$1"
    pin_certificate "$place/certs"
    status=0
    orka-conformance --certs "$place/certs" --only "$2" "$url" >"$out" 2>"$err" </dev/null || status=$?
}

@test "every bug that shows over HTTPS is found by its case" {
    found=0
    while read -r bug case _; do
        judge "$bug" "$case"
        expect_status 1
        expect_out_has "FAILED   $case: "
        found=$((found + 1))
    done < <(grep ' yes$' "$place/bugs")
    [ "$found" -ge 25 ]
}

@test "a bug that is listed as hidden over HTTPS does not show there" {
    while read -r bug case _; do
        judge "$bug" "$case"
        expect_status 0
        expect_out_has "passed   $case"
    done < <(grep ' no$' "$place/bugs")
}
