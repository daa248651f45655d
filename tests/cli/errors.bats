#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What an error tells: what failed, why, what can be done, and where to look.
load helper

stopped=""

teardown() {
    [ -z "$stopped" ] || kill -CONT "$stopped"
    release_lock
    host_down
}

# timed ARGS...: runs a command of the subtree; leaves its $milliseconds.
timed() {
    local started=$EPOCHREALTIME
    lumo "$@"
    milliseconds=$(((${EPOCHREALTIME/./} - ${started/./}) / 1000))
}

# expect_document EXPRESSION: standard error is one line that holds one JSON document d for which this holds.
expect_document() {
    [ "$(wc -l <"$err")" -eq 1 ] || mismatch "one line on standard error"
    python3 -c 'import json, sys
d = json.load(open(sys.argv[1], encoding="utf-8"))
sys.exit(0 if eval(sys.argv[2]) is True else f"{sys.argv[2]}: {d}")' "$err" "$1" || mismatch "a document for which: $1"
}

@test "an error is one line: what failed, its cause, a hint" {
    host_up
    lumo faultInjection rule remove --fault STORAGE_FAULT
    expect_status 1
    expect_err $'tovicli: The injection rule could not be removed. there is no rule for STORAGE_FAULT and * (\'faultInjection rule add\' makes a rule)\n'
}

@test "in every machine format an error is one JSON document" {
    host_up
    formats="$(tovicli --format none --version 2>&1 | sed 's/.*there is //; s/ (try.*//; s/,//g' || true)"
    [[ "$formats" == *json* ]]
    for format in $formats; do
        case "$format" in simple | table | tree) continue ;; esac
        tovi --format "$format" storage internal lumo faultInjection rule remove --fault STORAGE_FAULT
        expect_status 1
        expect_document 'd["error"]["code"] == 64 and d["error"]["cause"] == "there is no rule for STORAGE_FAULT and *"'
        expect_document 'sorted(d["error"]) == ["cause", "code", "hint", "message", "requestId", "warnings"]'
        expect_document 'd["error"]["hint"].endswith("makes a rule") and d["error"]["warnings"] == []'
    done
}

@test "hostile bytes leave the document valid" {
    host_up
    tovi --format json storage internal lumo orkaprovider remove --vp-name $'a"\e[2J\u202e]]>\n{}'
    expect_status 1
    expect_document '"a\"\x1b[2J\u202e" in d["error"]["message"]'
    tovi --format json storage $'\xff\xfe'
    expect_status 2
    expect_document '"\\xff\\xfe" in d["error"]["message"]'
}

@test "one request id stands in the error, in the daemon's log and in the trace" {
    host_up
    TOVI_REQUEST_ID=job-17 tovi --format json --log-level trivia storage internal lumo faultInjection rule remove --fault TIMEOUT
    expect_status 1
    grep -qE ' job-17 modifyFaultInjectionRule failed with code 64' "$TOVI_ROOT/log/lumod.log"
    grep -qE '^tovicli: trace: [0-9.]+ call method="modifyFaultInjectionRule" request="job-17" .* code=64 ' "$err"
    grep -qE '^\{"error":.*"requestId":"job-17"' "$err"

    # Without one, each run has its own.
    json_of faultInjection rule remove --fault TIMEOUT
    expect_document 'len(d["error"]["requestId"]) == 32'
    grep -qF " $(python3 -c 'import json,sys; print(json.load(open(sys.argv[1]))["error"]["requestId"])' "$err") modify" "$TOVI_ROOT/log/lumod.log"
    TOVI_REQUEST_ID='no id' tovi storage internal lumo storagecontainer load
    expect_failure 2 "TOVI_REQUEST_ID: 'no id' is no request id"
}

@test "a trace leaves standard output alone and tells every request" {
    host_up
    register_provider
    load_containers
    container=3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    tovi --format json storage internal lumo virtualvolume metadata list -c "$container" -u a1b20001-1111-4aaa-8aaa-000000000001
    cp "$out" "$BATS_TEST_TMPDIR/untraced"
    tovi --format json --log-level trivia storage internal lumo virtualvolume metadata list -c "$container" -u a1b20001-1111-4aaa-8aaa-000000000001
    expect_status 0
    cmp "$out" "$BATS_TEST_TMPDIR/untraced"
    run ! grep -vE '^tovicli: trace: [0-9]+\.[0-9]{3} (run|plugin|parsed|call|command|output|end)( [A-Za-z]+=("([^"\\]|\\.)*"|-?[0-9.]+))*$' "$err"
    grep -qE ' call method="getLumoMetadata" .* sentBytes=[1-9][0-9]* receivedBytes=[1-9][0-9]* replies=[1-9] code=0 tookMs=[0-9.]+$' "$err"
    grep -qE " output format=\"json\" bytes=$(wc -c <"$out") " "$err"
}

@test "--timeout reaches a provider that does not answer" {
    host_up
    register_provider
    hold_lock "$LUMO_ARRAY_FILE"
    timed storagecontainer load --timeout 1s
    [ "$milliseconds" -lt 2500 ] || mismatch "an end within the timeout, it took $milliseconds ms"
    [ "$status" -ne 0 ]
    expect_out ""
    timed storagecontainer load --timeout 2500ms
    [ "$milliseconds" -gt 1000 ] && [ "$milliseconds" -lt 4500 ] || mismatch "the longer timeout, it took $milliseconds ms"
}

@test "--timeout reaches a daemon that does not answer, and the hint names it" {
    host_up
    stopped="$(cat "$TOVI_ROOT/run/lumod.pid")"
    kill -STOP "$stopped"
    timed storagecontainer load --timeout 700ms
    expect_failure 3 "gave no answer within 700 ms" "(--timeout gives it more time)"
    [ "$milliseconds" -ge 700 ]
    [ "$milliseconds" -lt 2500 ]
}

@test "a store of a newer release, or of another program's, is told with what to do" {
    host_without_daemon
    export TOVI_OFFLINE=1
    lumo orkaprovider add --vp-name lab --vp-url u
    expect_status 0
    sqlite3 "$TOVI_ROOT/host.db" 'PRAGMA user_version = 99'
    lumo orkaprovider add --vp-name two --vp-url u
    expect_failure 1 "(it was left as it is; use the newer release that wrote it)"
    sqlite3 "$TOVI_ROOT/host.db" 'PRAGMA application_id = 7'
    lumo orkaprovider add --vp-name two --vp-url u
    expect_failure 1 "(it was left as it is; move it elsewhere if it is not needed)"
}
