#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Looking over a host that is well, and hosts that are not. Nothing is ever changed by it.
load helper

# Everything about a root's files that a look must leave alone.
snapshot() {
    find "$TOVI_ROOT" -not -path "$TOVI_ROOT/log*" -printf '%P %y %m %s %T@ %C@ %i\n' | sort
    find "$TOVI_ROOT" -type f -not -path "$TOVI_ROOT/log*" -exec cksum {} + 2>/dev/null | sort
}

# doctor STATUS [OPTIONS]: looks over the host in JSON, expects the status and that nothing has changed.
doctor() {
    local expected="$1" before
    shift
    before="$(snapshot)"
    tovi --format json "$@" cli doctor
    [ "$(snapshot)" = "$before" ] || mismatch "nothing to have changed: $(diff <(echo "$before") <(snapshot))"
    expect_status "$expected"
}

# expect_check NAME STATE [TEXT]: a row of that name and state whose detail holds the text.
expect_check() {
    expect_json "[c for c in d if c['Check'] == '$1'] != [] and all(c['State'] == '$2' and '''${3:-}''' in c['Detail'] for c in d if c['Check'] == '$1')"
}

@test "a healthy host: every check is ok, status 0" {
    mounted_host
    doctor 0
    expect_err ""
    expect_json 'all(c["State"] == "ok" for c in d)'
    expect_check store ok "1 provider, 3 mounted containers"
    expect_check daemon ok "version 1.0.0, up for "
    expect_check "peer rights" ok
    expect_check "provider lab" ok "serves 3 containers of array-north, array-south"
    tovi cli doctor
    expect_status 0
    [ "$(wc -l <"$out")" -eq 10 ]
}

@test "no root" {
    tovi --root "$BATS_TEST_TMPDIR/none" --format json cli doctor
    expect_status 1
    expect_json 'd == [{"Check": "root", "State": "fail", "Detail": d[0]["Detail"]}] and "No such file" in d[0]["Detail"]'
    [ ! -e "$BATS_TEST_TMPDIR/none" ]
    expect_err_has "1 of 1 checks failed"
}

@test "a root that is a file" {
    touch "$BATS_TEST_TMPDIR/file"
    tovi --root "$BATS_TEST_TMPDIR/file" --format json cli doctor
    expect_status 1
    expect_check root fail "is no directory"
}

@test "no store and no daemon" {
    host_without_daemon
    doctor 1
    expect_check store warn "does not exist"
    expect_check socket fail "does not exist: no daemon was started on this root"
}

@test "a damaged store, a store of somebody else's, and a newer one" {
    host_without_daemon
    export TOVI_OFFLINE=1
    register_provider lab file:///none.array
    cp "$TOVI_ROOT/host.db" "$BATS_TEST_TMPDIR/good.db"
    dd if=/dev/urandom of="$TOVI_ROOT/host.db" bs=4096 seek=1 count=2 conv=notrunc status=none
    doctor 1
    expect_check store fail "host.db"
    cp "$BATS_TEST_TMPDIR/good.db" "$TOVI_ROOT/host.db"
    sqlite3 "$TOVI_ROOT/host.db" "PRAGMA application_id=7"
    doctor 1
    expect_check store fail "belongs to another program"
    cp "$BATS_TEST_TMPDIR/good.db" "$TOVI_ROOT/host.db"
    sqlite3 "$TOVI_ROOT/host.db" "PRAGMA user_version=99"
    doctor 1
    expect_check store fail "newer version"
    head -c 100 /dev/zero | tr '\0' x >"$TOVI_ROOT/host.db"
    doctor 1
    expect_check store fail "is damaged"
}

@test "a transaction that a killed process left is told and left as it is" {
    host_without_daemon
    export TOVI_OFFLINE=1
    register_provider lab file:///none.array
    python3 -c 'import os, sqlite3, sys
database = sqlite3.connect(sys.argv[1], isolation_level=None)
database.execute("PRAGMA cache_size=1")
database.execute("PRAGMA cache_spill=1")
database.execute("BEGIN IMMEDIATE")
database.execute("UPDATE provider SET url = ?", ("x" * 200000,))
os._exit(0)' "$TOVI_ROOT/host.db"
    [ -s "$TOVI_ROOT/host.db-journal" ]
    doctor 1
    expect_check store warn "unfinished transaction"
    expect_check "provider lab" fail "/none.array"
    [ -s "$TOVI_ROOT/host.db-journal" ]
}

@test "a store that another process holds locked" {
    host_without_daemon
    export TOVI_OFFLINE=1
    register_provider lab file:///none.array
    hold_lock "$TOVI_ROOT/host.db"
    doctor 1 --timeout 300ms
    expect_check store fail "host.db"
}

@test "a dead daemon and its stale socket" {
    needs_file_url
    mounted_host
    pid="$(cat "$TOVI_ROOT/run/lumod.pid")"
    kill -KILL "$pid"
    timeout 10 tail --pid "$pid" -f /dev/null 3>&-
    doctor 1
    expect_check socket fail "is stale: no process listens on it"
    expect_check "provider lab" ok "nobody could be asked"
}

@test "a daemon that hangs takes no longer than the timeout" {
    mounted_host
    pid="$(cat "$TOVI_ROOT/run/lumod.pid")"
    kill -STOP "$pid"
    started=$EPOCHREALTIME
    doctor 1 --timeout 300ms
    elapsed=$(((${EPOCHREALTIME/./} - ${started/./}) / 1000))
    kill -CONT "$pid"
    [ "$elapsed" -lt 3000 ]
    expect_check socket ok
    expect_check daemon fail "300 ms"
}

@test "a socket that this user may not use" {
    [ "$(id -u)" -eq 0 ] || skip "only root becomes somebody else"
    mounted_host
    chmod a+rx "$BATS_RUN_TMPDIR" "$(dirname "$BATS_TEST_TMPDIR")" "$BATS_TEST_TMPDIR" "$TOVI_ROOT" "$TOVI_ROOT/run"
    chmod 600 "$TOVI_ROOT/run/lumod.sock"
    setpriv --reuid 65534 --regid 65534 --clear-groups true 2>/dev/null || skip "setpriv cannot"
    status=0
    setpriv --reuid 65534 --regid 65534 --clear-groups "$TOVI_BUILD_DIR/bin/tovicli" --format json cli doctor >"$out" 2>"$err" || status=$?
    [ "$status" -ne 126 ] && [ "$status" -ne 127 ] || skip "the build cannot be run by another user"
    expect_status 1
    expect_check socket fail "user 65534 may not use"
}

@test "what lies in the socket's place and is none" {
    host_without_daemon
    mkdir "$TOVI_ROOT/run"
    touch "$TOVI_ROOT/run/lumod.sock"
    doctor 1
    expect_check socket fail "is no socket"
}

@test "mounts against records: a missing directory, one without a record, one in the way" {
    mounted_host
    lumo configlumo add --name vm --container-id "$container"
    lumo configlumo mount --name vm --container-id "$container"
    expect_status 0
    rmdir "$TOVI_ROOT/volumes/silver"
    rmdir "$TOVI_ROOT/volumes/archive"
    touch "$TOVI_ROOT/volumes/archive"
    mkdir "$TOVI_ROOT/volumes/stray" "$TOVI_ROOT/volumes/gold/own" "$TOVI_ROOT/lumos/stray"
    rmdir "$TOVI_ROOT/volumes/gold/vm"
    doctor 1
    expect_check "mount silver" fail "is missing"
    expect_check "mount archive" fail "in the place"
    expect_check "directory stray" warn "has no record"
    expect_check "directory gold/own" warn "has no record"
    expect_check "config volume gold/vm" fail "is missing"
}

@test "a provider's file that is missing, empty, or of somebody else's" {
    host_up
    array="$LUMO_ARRAY_FILE"
    : >"$BATS_TEST_TMPDIR/empty.array"
    sqlite3 "$BATS_TEST_TMPDIR/other.array" "CREATE TABLE t (x)"
    mkdir "$BATS_TEST_TMPDIR/directory.array"
    for name in none empty other directory; do
        register_provider "$name" "file://$BATS_TEST_TMPDIR/$name.array"
    done
    register_provider good "file://$(dirname "$array")/small%2earray"
    doctor 1
    expect_check "provider none" fail "No such file"
    expect_check "provider empty" fail "no array file"
    expect_check "provider other" fail "another program"
    expect_check "provider directory" fail "no regular file"
    expect_check "provider good" ok "serves 3 containers"
}

@test "a provider elsewhere: served, gone, beside one that serves, and with nobody to ask" {
    TOVI_LAB_HTTPS=1 mounted_host
    url="$LUMO_ARRAY_URL"
    [[ "$url" == https://* ]]
    doctor 0
    expect_err ""
    expect_json 'all(c["State"] == "ok" for c in d)'
    expect_check "provider lab" ok "$url serves 3 containers of array-north, array-south"

    read -r orkasim _ <"$TOVI_ROOT/run/lab.orkasim"
    kill -KILL "$orkasim"
    timeout 10 tail --pid "$orkasim" -f /dev/null 3>&-
    doctor 1
    expect_check daemon ok
    expect_check containers fail "cannot be reached"
    expect_check "provider lab" warn "$url: nobody could be asked whether it is reached"

    orkasim make "$top/lab/topologies/small.json" "$TOVI_ROOT/arrays/other.array"
    register_provider near "file://$TOVI_ROOT/arrays/other.array"
    doctor 0
    expect_check "provider near" ok "serves 3 containers"
    expect_check "provider lab" warn "$url serves no container: it cannot be reached, exports none, or another provider is active for its arrays"

    host_down
    doctor 1
    expect_check socket fail "does not exist: no daemon was started on this root"
    expect_check "provider lab" warn "$url: nobody could be asked whether it is reached"
    expect_check "provider near" ok "nobody could be asked whether it is served"
}

@test "an endpoint in an outage, and a mounted container that nobody exports" {
    mounted_host
    lumo daemon set --start-pe-apd "$endpoint"
    lumo orkaprovider remove --vp-name lab
    expect_status 0
    doctor 0
    expect_check "endpoint $endpoint" warn "down"
    expect_check "container gold" warn "no provider exports it"
}
