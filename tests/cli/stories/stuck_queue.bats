#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# One array does not answer. A request to it holds the ordered queue; what need not wait for the queue is answered, and a
# request with priority passes it.
load ../helper

@test "fault_61 a stuck queue, reads and priority" {
    mounted_host
    "$TOVI_BUILD_DIR/bin/orkasim" make "$BATS_TEST_DIRNAME/../topologies/second.json" "$TOVI_ROOT/arrays/second.array"
    lumo orkaprovider add --vp-name second --vp-url "file://$TOVI_ROOT/arrays/second.array"
    load_containers
    slow="$LUMO_ARRAY_FILE"
    second=5ec00000-0000-4000-8000-000000000001

    lumo daemon set --log-level trivia
    hold_lock "$slow"
    asked="$(grep -c "queryStorageArray of provider 'lab'" "$TOVI_ROOT/log/lumod.log" || true)"
    TOVI_TIMEOUT_MS=60000 tovicli storage internal lumo configlumo add -n stuck -c "$container" \
        >"$BATS_TEST_TMPDIR/stuck" 2>&1 3>&- &
    stuck=$!
    until [ "$(grep -c "queryStorageArray of provider 'lab'" "$TOVI_ROOT/log/lumod.log" || true)" -gt "$asked" ]; do
        kill -0 "$stuck"
    done
    # The ordered queue is held as soon as an ordered request to the free array is not answered within its deadline.
    while true; do
        TOVI_TIMEOUT_MS=500 lumo configlumo add -n ordered -c "$second"
        [ "$status" -eq 0 ] || break
        lumo configlumo remove -n ordered -c "$second"
    done
    grep -qE "deadline|500 ms" "$err"
    kill -0 "$stuck"

    lumo daemon set --log-level info
    expect_done $'true\n'
    # The daemon has noticed by now that one provider is silent, and asks the others where the container is.
    TOVI_TIMEOUT_MS=4000 lumo configlumo add -n ahead -c "$second" --priority
    expect_done $'true\n'

    release_lock
    wait "$stuck"
    [ "$(cat "$BATS_TEST_TMPDIR/stuck")" = true ]
    [ -n "$(volume_uuid stuck)" ]
    lumo configlumo add -n behind -c "$second"
    expect_done $'true\n'
}
