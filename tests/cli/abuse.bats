#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What nobody types on purpose. The numbers are those of the catalogue of faults.
load helper

setup() {
    host_without_daemon
}

@test "fault_2 an argument as long as the system lets through" {
    # One word holds 128 KiB at most; many of them make the 2 MB.
    export TOVI_OFFLINE=1
    long="$(head -c 130000 /dev/zero | tr '\0' x)"
    words=()
    for _ in {1..14}; do
        words+=(--arrayid "$long")
    done
    lumo orkaprovider add --vp-name lab --vp-url u "${words[@]}"
    expect_failure 1 "Missing one of the  parameter arrayIdor priority or isActive for an Array "
    lumo orkaprovider add --vp-name lab --vp-url u "$long"
    expect_status 2
    [ "$(wc -c <"$err")" -lt 2000 ]
}

@test "fault_3 bytes that are no UTF-8 are refused and shown escaped" {
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name $'lab\xff' --vp-url u
    expect_failure 2 'lab\xff'
    LC_ALL=C run ! grep -q $'\xff' "$err"
    [ ! -e "$TOVI_ROOT/host.db" ]
}

@test "fault_6 with its standard descriptors closed the tool writes nothing into a database file" {
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name first --vp-url u
    status=0
    tovicli storage internal lumo orkaprovider add --vp-name second --vp-url u <&- >&- 2>&- || status=$?
    [ "$status" -ne 0 ]
    [ "$(sqlite3 "$TOVI_ROOT/host.db" 'PRAGMA integrity_check')" = ok ]
    run ! grep -aq "Succesfully" "$TOVI_ROOT/host.db"
}

@test "fault_31 a daemon that stands still: the tool ends at its deadline" {
    host_up
    register_provider
    read -r daemon _ <"$TOVI_ROOT/run/lab.daemon"
    kill -STOP "$daemon"
    TOVI_TIMEOUT_MS=500 lumo storagecontainer load
    kill -CONT "$daemon"
    expect_failure 3 "500 ms"
}

@test "fault_59 two tools on one key: one adds it, the other finds it there" {
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name first --vp-url u
    for round in 1 2 3 4 5; do
        pids=()
        for one in a b c; do
            (
                status=0
                tovicli storage internal lumo orkaprovider add --vp-name "key$round" --vp-url "$one" \
                    >"$BATS_TEST_TMPDIR/$one.out" 2>"$BATS_TEST_TMPDIR/$one.err" || status=$?
                echo "$status" >"$BATS_TEST_TMPDIR/$one.status"
            ) 3>&- &
            pids+=($!)
        done
        wait "${pids[@]}"
        # Each one is done or refused in words; what is stored is one of those that were told to be.
        grep -lx 0 "$BATS_TEST_TMPDIR"/?.status
        for one in a b c; do
            [ "$(cat "$BATS_TEST_TMPDIR/$one.status")" = 0 ] || grep -q "already exists" "$BATS_TEST_TMPDIR/$one.err"
        done
        [ "$(stored_providers | grep -c "^key$round|[abc]$")" = 1 ]
    done
}

@test "a request whose sending is interrupted is sent all the same" {
    host_up
    register_provider
    status=0
    traced -qq -o "$BATS_TEST_TMPDIR/trace" -e trace=sendmsg -e inject=sendmsg:error=EINTR:when=1 \
        tovicli storage internal lumo faultInjection enable --enabled true >"$out" 2>"$err" || status=$?
    expect_done $'true\n'
    [ "$(grep -c "EINTR.*INJECTED" "$BATS_TEST_TMPDIR/trace")" = 1 ]
}

@test "fault_63 a reader that went away" {
    host_up
    register_provider
    status=0
    (
        trap '' PIPE
        status=0
        tovicli storage internal lumo storagecontainer load 2>"$err" 3>&- || status=$?
        echo "$status" >"$BATS_TEST_TMPDIR/status"
    ) | true
    status="$(cat "$BATS_TEST_TMPDIR/status")"
    : >"$out"
    # The reader may have been there for the first bytes, so the status is 0 or that of unwritten output.
    [ "$status" -eq 0 ] || [ "$status" -eq 4 ] || mismatch "status 0 or 4"
    [ -d "$TOVI_ROOT/volumes/gold" ]
}
