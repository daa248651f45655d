#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# orka-conformance as a user types it.
load helper

setup() {
    array="$BATS_TEST_TMPDIR/test.array"
    orkasim make "$top/lab/topologies/small.json" "$array"
    url="file://$array"
}

# conformance ARGS...: runs the program; leaves $status, $out and $err.
conformance() {
    status=0
    orka-conformance "$@" >"$out" 2>"$err" </dev/null || status=$?
}

contents() {
    orkasim show "$array" | grep -v "Host's context"
}

@test "cases that pass are told one a line, with a sum at the end" {
    conformance --only 'volume/create/size-*' "$url"
    expect_status 0
    expect_out - <<'END'
passed   volume/create/size-default
passed   volume/create/size-one
passed   volume/create/size-maximum
passed   volume/create/size-above-maximum
passed   volume/create/size-negative
5 cases: 5 passed, 0 failed, 0 skipped
END
    expect_err ""
}

@test "a sample of every noun passes on the sample array, and leaves it as it was" {
    before="$(contents)"
    conformance --only '*/list/*' --only 'unknown-*' --only 'cut/bind/*' --only 'residue/*' "$url"
    expect_status 0
    expect_out_has "passed   cut/bind/killed-at-once" "passed   residue/volumes" " 0 failed"
    [ "$(contents)" = "$before" ]
}

@test "a case that fails tells what it demands, what was expected and what came" {
    conformance --bug rebinds --only volume/bind/other-endpoint "$url"
    expect_status 1
    expect_out - <<'END'
FAILED   volume/bind/other-endpoint: A volume that is bound is not bound to another endpoint.
         expected binding it to another endpoint: failure 27 (in use)
         came     success
1 cases: 0 passed, 1 failed, 0 skipped
END
    expect_err ""
}

@test "JSON is one document" {
    conformance --format json --only 'volume/create/n*' --seed 5 "$url"
    expect_status 0
    expect_json 'd["seed"] == 5 and d["failed"] == 0 and d["passed"] == len(d["cases"]) and not d["interrupted"]'
    expect_json 'all(c["verdict"] == "passed" and c["demand"].endswith(".") for c in d["cases"])'
}

@test "JUnit goes to a file" {
    conformance --format junit --output "$BATS_TEST_TMPDIR/result.xml" --bug sorts-ids --only 'volume/query-by-id/o*' "$url"
    expect_status 1
    expect_out ""
    python3 -c 'import sys, xml.etree.ElementTree as tree
suite = tree.parse(sys.argv[1]).getroot().find("testsuite")
assert suite.get("tests") == "2" and suite.get("failures") == "1", suite.attrib
assert [case.get("name") for case in suite.findall("testcase") if case.find("failure") is not None] == ["order"]' \
        "$BATS_TEST_TMPDIR/result.xml"
}

@test "the list of cases needs no provider" {
    conformance --list
    expect_status 0
    expect_out_has "volume/create/name-taken" "    A directory name that the container has already is refused."
    [ "$(grep -vc '^ ' "$out")" -ge 120 ]
    conformance --list-bugs
    expect_status 0
    [ "$(grep -vc '^ ' "$out")" -ge 20 ]
}

@test "words that make no sense are usage errors" {
    for words in "" "--nope $url" "$url more" "--only no/such/case $url" "--bug nope $url" "--timeout 0 $url" "ftp://host/"; do
        # shellcheck disable=SC2086  # several words
        conformance $words
        expect_failure 2 "usage: orka-conformance"
    done
}

@test "a provider that is not there is told apart from one that fails" {
    conformance "file://$BATS_TEST_TMPDIR/missing.array"
    expect_failure 3 "orka-conformance: the provider cannot be reached: the array file '$BATS_TEST_TMPDIR/missing.array' does not exist"
}

@test "a provider that is too slow is not reached" {
    hold_lock "$array"
    conformance --timeout 100ms "$url"
    expect_failure 3 "the provider cannot be reached"
}

@test "a result that cannot be written is told" {
    [ -e /dev/full ] || skip "there is no /dev/full"
    conformance --only volume/create/size-one --output /dev/full "$url"
    expect_failure 4 "the result could not be written"
    conformance --output "$BATS_TEST_TMPDIR/no/such/directory" "$url"
    expect_failure 4 "cannot be written"
}

@test "an interrupted run removes what it made, and says so" {
    before="$(contents)"
    mkfifo "$BATS_TEST_TMPDIR/result"
    orka-conformance "$url" >"$BATS_TEST_TMPDIR/result" 2>"$err" </dev/null &
    run_id=$!
    # Once forty cases are through it is in the middle of making volumes.
    exec 4<"$BATS_TEST_TMPDIR/result"
    for _ in $(seq 40); do
        read -r _ <&4
    done
    kill -INT "$run_id"
    cat <&4 >"$out"
    exec 4<&-
    status=0
    wait "$run_id" || status=$?
    expect_status 130
    expect_out_has "interrupted after "
    expect_err ""
    [ "$(contents)" = "$before" ]
}

@test "docs/conformance.md shows what happens" {
    cd "$top"
    export TMPDIR="$BATS_TEST_TMPDIR"
    python3 "$BATS_TEST_DIRNAME/run_tour.py" docs/conformance.md 3>&- >&2
}
