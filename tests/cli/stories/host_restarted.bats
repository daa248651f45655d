#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# The daemon is killed and the host goes on: what was acknowledged is there, what lies on the array or in the host store
# needs nobody's memory.
load ../helper

# kill_daemon: as a power cut would end it.
kill_daemon() {
    read -r pid _ <"$TOVI_ROOT/run/lab.daemon"
    kill -KILL "$pid"
    "$top/lab/down" --root "$TOVI_ROOT" 2>/dev/null
}

@test "killed in the middle of everything" {
    mounted_host
    path="$TOVI_ROOT/volumes/$container_name"
    for name in mounted unmounted; do
        lumo configlumo add -n "$name" -c "$container"
        lumo configlumo mount -n "$name" -c "$container"
        expect_status 0
        echo "$name" >"$path/$name/file"
    done
    lumo configlumo umount -n unmounted -c "$container"
    lumo orkacontext set -u 11111111-2222-3333-4444-555555555555
    lumo daemon set --start-pe-apd "$endpoint"

    kill_daemon
    lumo configlumo add -n meanwhile -c "$container"
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
    [ "$(cat "$path/mounted/file")" = mounted ]

    host_up
    json_of storagecontainer load
    expect_status 0
    expect_json 'd == []'
    lumo configlumo mount -n unmounted -c "$container"
    expect_done $'true\n'
    [ "$(cat "$path/unmounted/file")" = unmounted ]
    lumo configlumo umount -n mounted -c "$container"
    expect_done $'true\n'
    json_of storagecontainer checklumos -p "$path"
    expect_status 0
    expect_json 'len(d) >= 2'
    lumo daemon set --end-pe-apd "$endpoint"
    expect_err_has "$container_name, "
}

@test "fault_27 killed while it creates: done or not done, never between" {
    mounted_host
    for attempt in 1 2 3 4 5; do
        tovicli storage internal lumo configlumo add -n "vm$attempt" -c "$container" >"$out" 2>"$err" 3>&- &
        creating=$!
        kill_daemon
        status=0
        wait "$creating" || status=$?
        host_up
        uuid="$(volume_uuid "vm$attempt")"
        # What was acknowledged is there. What was not may be there too: the answer was lost, not the work.
        if [ "$status" -eq 0 ]; then
            [ -n "$uuid" ]
        fi
        if [ -z "$uuid" ]; then
            lumo configlumo add -n "vm$attempt" -c "$container"
            expect_done $'true\n'
        fi
        lumo configlumo mount -n "vm$attempt" -c "$container"
        expect_done $'true\n'
    done
}

@test "fault_29 a second daemon on the same root leaves the first undisturbed" {
    mounted_host
    run -1 "$top/lab/up" --root "$TOVI_ROOT" --build "$TOVI_BUILD_DIR"
    run ! "$TOVI_BUILD_DIR/bin/lumod" --root "$TOVI_ROOT"
    lumo configlumo add -n vm -c "$container"
    expect_done $'true\n'
}

@test "a topology that is none brings nothing up and leaves nothing behind" {
    mkdir "$BATS_TEST_TMPDIR/temporary"
    echo '{' >"$BATS_TEST_TMPDIR/bad.json"
    status=0
    TMPDIR="$BATS_TEST_TMPDIR/temporary" "$top/lab/up" --topology "$BATS_TEST_TMPDIR/bad.json" >"$out" 2>"$err" || status=$?
    expect_status 1
    expect_out $'false\n' # for the shell that evaluates it
    grep -q 'bad.json: line 2, column 1: Missing a name for object member.' "$err"
    [ -z "$(ls -A "$BATS_TEST_TMPDIR/temporary")" ]
}
