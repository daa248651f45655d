#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# Every bug that the simulator can be given, judged over HTTPS. What is listed as hidden there must be, or the list is old.
load helper

setup() {
    array_in_memory
    # shellcheck disable=SC2016  # the backquotes are Markdown's
    orka-conformance --list-bugs --format markdown |
        sed -n 's/^| `\(.*\)` | .* | `\(.*\)` | \(yes\|no\).* |$/\1 \2 \3/p' >"$place/bugs"
    [ "$(wc -l <"$place/bugs")" = "$(orka-conformance --list-bugs --format markdown | wc -l)" ]
}

teardown() {
    serve_no_more
    host_down
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

# whole_host: what a user does with a host, whatever comes of it. Each command ends by itself, in words.
whole_host() {
    local command
    for command in "storagecontainer load" "configlumo add -n vm -c $gold -s 8" "configlumo mount -n vm -c $gold" \
        "storagecontainer checklumos -p $TOVI_ROOT/volumes/gold" "virtualvolume get -c $gold -u $known" \
        "virtualvolume metadata list -c $gold -u $known" "configlumo umount -n vm -c $gold" "daemon set --unbind-now" \
        "configlumo remove -n vm -c $gold"; do
        # shellcheck disable=SC2086  # several words
        lumo $command --timeout 5s
        case "$status" in
        0) expect_err "" ;;
        1 | 3) [ "$(wc -l <"$err")" = 1 ] ;;
        *) mismatch "status 0, 1 or 3 of: $command" ;;
        esac
    done
}

@test "a host survives every bug of its array, and is well again when the bug has gone" {
    gold=3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    known=a1b20001-1111-4aaa-8aaa-000000000001
    host_up
    serve_array "$place/test.array"
    pin_certificate "$TOVI_ROOT/certs"
    register_provider lab "$url"
    daemon="$(cat "$TOVI_ROOT/run/lumod.pid")"
    listen="${url#https://}"
    listen="${listen%/orka}"
    before="$(sqlite3 "$place/test.array" "SELECT * FROM volume ORDER BY seq")"
    while read -r bug _; do
        serve_array "$place/test.array" --listen "$listen" --bug "$bug"
        whole_host
        # Whatever the bug has made of it, a provider without one finishes it.
        serve_array "$place/test.array" --listen "$listen"
        lumo storagecontainer load
        expect_status 0
        lumo configlumo remove -n vm -c "$gold"
        lumo configlumo add -n vm -c "$gold"
        expect_done $'true\n'
        lumo configlumo mount -n vm -c "$gold"
        expect_done $'true\n'
        lumo configlumo remove -n vm -c "$gold"
        expect_done $'true\n'
        [ "$(sqlite3 "$place/test.array" "SELECT * FROM volume ORDER BY seq")" = "$before" ] || mismatch "no trace of $bug"
        [ "$(cat "$TOVI_ROOT/run/lumod.pid")" = "$daemon" ]
    done <"$place/bugs"
    kill -0 "$daemon"
}
