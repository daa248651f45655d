# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# What the transcripts share: a host in a box for each test, running the tool, and looking at what it left.
#
# The build's directory comes from TOVI_BUILD_DIR, which ctest sets. Every test runs on a root of its own and starts and
# stops its own lumod. Output is compared whole, to the newline: $out and $err are files.

bats_require_minimum_version 1.5.0

top="$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)"
: "${TOVI_BUILD_DIR:?run the transcripts through ctest, or set TOVI_BUILD_DIR to a build directory}"
export PATH="$TOVI_BUILD_DIR/bin:$PATH"
unset TOVI_ROOT TOVI_OFFLINE TOVI_TIMEOUT_MS TOVI_REQUEST_ID TOVI_LOG_LEVEL

out="$BATS_TEST_TMPDIR/out"
err="$BATS_TEST_TMPDIR/err"
status=0

# host_up [lab/up options]: a fresh root with one array, served by a lumod; what follows works on it. With
# TOVI_LAB_HTTPS=1 the array is behind orkasim, and every transcript has to come out the same.
host_up() {
    local settings
    local -a https=()
    [ "${TOVI_LAB_HTTPS:-}" != 1 ] || https=(--https)
    settings="$("$top/lab/up" "${https[@]}" --root "$BATS_TEST_TMPDIR/host" --build "$TOVI_BUILD_DIR" "$@" 2>"$BATS_TEST_TMPDIR/up")" || {
        cat "$BATS_TEST_TMPDIR/up" >&2
        return 1
    }
    eval "$settings"
}

# array_in_memory: $place, a directory for an array that takes thousands of commits: in memory where there is room for it.
array_in_memory() {
    local memory=/dev/shm
    [ -w "$memory" ] || memory="$BATS_TEST_TMPDIR"
    place="$(mktemp -d -p "$memory")"
    orkasim make "$top/lab/topologies/small.json" "$place/test.array"
}

# needs_file_url: leaves a test out whose array is behind orkasim, since it is about URLs of files.
needs_file_url() {
    [ "${TOVI_LAB_HTTPS:-}" != 1 ] || skip "left to another run: of an array file that lumod opens itself"
}

# needs_no_sanitizer WHY: leaves a test out that cannot hold where the programs are built under sanitizers.
needs_no_sanitizer() {
    [ "${TOVI_SANITIZED:-}" != 1 ] || skip "left to another run: $1"
}

# traced OPTIONS... PROGRAM...: strace of a program. Where the programs look for leaks, a traced one cannot.
traced() {
    ASAN_OPTIONS="${ASAN_OPTIONS:+$ASAN_OPTIONS:}detect_leaks=0" strace "$@"
}

# host_down: stops this test's lumod, if it runs; the root stays for whoever looks into a failure.
host_down() {
    if [ -e "$BATS_TEST_TMPDIR/host/run/lab.daemon" ] || [ -e "$BATS_TEST_TMPDIR/host/run/lab.orkasim" ]; then
        "$top/lab/down" --root "$BATS_TEST_TMPDIR/host" 2>"$BATS_TEST_TMPDIR/down" || {
            cat "$BATS_TEST_TMPDIR/down" >&2
            return 1
        }
    fi
}

# host_without_daemon: a root as a host has it whose daemon was never started.
host_without_daemon() {
    export TOVI_ROOT="$BATS_TEST_TMPDIR/host"
    mkdir -p "$TOVI_ROOT"
}

lock_holder=""
array_server=""

teardown() {
    release_lock
    serve_no_more
    host_down
}

# tovi ARGS...: runs the tool; leaves $status, and what it wrote in $out and $err.
tovi() {
    status=0
    tovicli "$@" >"$out" 2>"$err" </dev/null || status=$?
}

# lumo ARGS...: a command of the subtree that this project adds.
lumo() {
    tovi storage internal lumo "$@"
}

# json_of ARGS...: the same in JSON.
json_of() {
    tovi --format json storage internal lumo "$@"
}

register_provider() {
    lumo orkaprovider add --vp-name "${1:-lab}" --vp-url "${2:-$LUMO_ARRAY_URL}"
    expect_status 0
}

load_containers() {
    lumo storagecontainer load
    expect_status 0
}

# What a failed expectation prints: the whole of what was seen.
mismatch() {
    {
        echo "expected $1"
        echo "--- status $status; standard output:"
        cat -A "$out"
        echo "--- standard error:"
        cat -A "$err"
    } >&2
    return 1
}

expect_status() {
    [ "$status" -eq "$1" ] || mismatch "status $1"
}

# expect_out TEXT: standard output is exactly this, byte for byte; expect_out - takes it from standard input.
expect_out() {
    expect_file "$out" "standard output" "$1"
}

# expect_err TEXT: the same for standard error.
expect_err() {
    expect_file "$err" "standard error" "$1"
}

expect_file() {
    if [ "$3" = - ]; then
        cat >"$BATS_TEST_TMPDIR/expected"
    else
        printf '%s' "$3" >"$BATS_TEST_TMPDIR/expected"
    fi
    cmp -s "$1" "$BATS_TEST_TMPDIR/expected" || {
        diff -u "$BATS_TEST_TMPDIR/expected" "$1" >&2 || true
        mismatch "$2: $(cat -A "$BATS_TEST_TMPDIR/expected")"
    }
}

# expect_err_has TEXT...: standard error holds each of these.
expect_err_has() {
    local text
    for text in "$@"; do
        grep -qF -- "$text" "$err" || mismatch "standard error to hold: $text"
    done
}

expect_out_has() {
    local text
    for text in "$@"; do
        grep -qF -- "$text" "$out" || mismatch "standard output to hold: $text"
    done
}

# expect_failure STATUS TEXT...: this status, nothing on standard output, each text on standard error.
expect_failure() {
    expect_status "$1"
    expect_out ""
    expect_err_has "${@:2}"
}

# expect_done TEXT: status 0, exactly this on standard output, nothing on standard error.
expect_done() {
    expect_status 0
    expect_out "$1"
    expect_err ""
}

# expect_json EXPRESSION: standard output is one JSON document d for which the Python expression holds.
expect_json() {
    python3 -c 'import json, sys
d = json.load(open(sys.argv[1]))
result = eval(sys.argv[2])
if result is not True:
    sys.exit(f"{sys.argv[2]} gives {result!r}")' "$out" "$1" || mismatch "JSON for which this holds: $1"
}

# json_value EXPRESSION: prints what the expression makes of the document d.
json_value() {
    python3 -c 'import json, sys
d = json.load(open(sys.argv[1]))
print(eval(sys.argv[2]))' "$out" "$1"
}

# hold_lock FILE: another process keeps the database for itself, until release_lock or the test's end.
hold_lock() {
    mkfifo "$BATS_TEST_TMPDIR/lock.go" "$BATS_TEST_TMPDIR/lock.held"
    python3 -c 'import sqlite3, sys
database = sqlite3.connect(sys.argv[1], isolation_level=None)
database.execute("BEGIN EXCLUSIVE")
print("held", flush=True)
sys.stdin.read()' "$1" <>"$BATS_TEST_TMPDIR/lock.go" >"$BATS_TEST_TMPDIR/lock.held" 3>&- &
    lock_holder=$!
    read -r _ <"$BATS_TEST_TMPDIR/lock.held"
}

release_lock() {
    [ -n "$lock_holder" ] || return 0
    kill "$lock_holder"
    wait "$lock_holder" 2>/dev/null || true
    lock_holder=""
    rm -f "$BATS_TEST_TMPDIR/lock.go" "$BATS_TEST_TMPDIR/lock.held"
}

# serve_array FILE OPTIONS...: an orkasim of the test's own. Leaves its $url and its $certificate, which pin_certificate
# lets a host or the kit trust. A second one replaces the first.
serve_array() {
    serve_no_more
    local pipe="$BATS_TEST_TMPDIR/serve.url"
    certificate="$BATS_TEST_TMPDIR/serve.cert.pem"
    mkfifo "$pipe"
    orkasim serve --cert "$certificate" --key "$BATS_TEST_TMPDIR/serve.key.pem" "${@:2}" "$1" \
        >"$pipe" 2>"$BATS_TEST_TMPDIR/serve.log" 3>&- &
    array_server=$!
    read -r url <"$pipe"
    rm "$pipe"
}

serve_no_more() {
    [ -n "$array_server" ] || return 0
    kill "$array_server"
    wait "$array_server" || true
    array_server=""
}

# pin_certificate DIRECTORY: the certificate of the last serve_array as its client looks for it there.
pin_certificate() {
    local authority="${url#https://}"
    authority="${authority%%/*}"
    mkdir -p "$1"
    cp "$certificate" "$1/${authority%:*}_${authority##*:}.pem"
}

# stored_providers: the host's records, one line each, as name|url, then arrays as id/active/priority.
stored_providers() {
    sqlite3 "$TOVI_ROOT/host.db" "
        SELECT p.name || '|' || p.url || coalesce((SELECT group_concat('|' || a.array_id || '/' || a.is_active || '/' || a.priority, '')
            FROM (SELECT * FROM provider_array WHERE provider = p.id ORDER BY position) a), '')
        FROM provider p ORDER BY p.id"
}

# mounted_host [lab/up options]: a host with its provider registered and its containers mounted. Leaves the first
# container's $container (id), $container_name, $array (id of its first array) and $endpoint (uid of that one's first).
mounted_host() {
    host_up "$@"
    register_provider
    json_of storagecontainer load
    expect_status 0
    container="$(json_value 'd[0]["StorageContainer Id"]')"
    container_name="$(json_value 'd[0]["StorageContainer Name"]')"
    array="$(json_value 'd[0]["Arrays"][0]["ArrayId"]')"
    endpoint="$(json_value 'd[0]["Arrays"][0]["PEInfo"][0].split("localUID: ")[1].split(",")[0]')"
}

# volume_uuid DIRECTORY: the uuid of the config volume of that directory name, as the array file has it.
volume_uuid() {
    sqlite3 "$LUMO_ARRAY_FILE" "SELECT uuid FROM volume WHERE directory_name = '$1'"
}

# all_endpoints: the uids of the endpoints of every array, as the array file has them.
all_endpoints() {
    sqlite3 "$LUMO_ARRAY_FILE" "SELECT uid FROM endpoint WHERE uid IS NOT NULL ORDER BY uid"
}
