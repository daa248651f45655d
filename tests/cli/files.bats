#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Database files that are not what they should be: refused with path and reason, and not a byte of them changed.
load helper

setup() {
    host_without_daemon
}

# spoil FILE HOW: makes of the file one of the kinds that are refused.
spoil() {
    case "$2" in
    malformed) printf 'this is no database, only text that is long enough to be looked at as a header ................' >"$1" ;;
    foreign) sqlite3 "$1" 'PRAGMA application_id = 4711; CREATE TABLE IF NOT EXISTS somebody (theirs TEXT)' ;;
    newer) sqlite3 "$1" 'PRAGMA user_version = 99' ;;
    truncated) truncate -s 2000 "$1" ;;
    esac
}

# expect_refused FILE HOW COMMAND...: the command fails, names path and reason, and leaves the file as it was.
expect_refused() {
    local file="$1" how="$2" before
    shift 2
    before="$(sha256sum <"$file")"
    "$@"
    [ "$status" -ne 0 ] || mismatch "a failure"
    expect_out ""
    case "$how" in
    malformed | truncated) expect_err_has "$file" ;;
    foreign) expect_err_has "$file" "another program" ;;
    newer) expect_err_has "$file" "newer" ;;
    esac
    [ "$(sha256sum <"$file")" = "$before" ] || mismatch "$file unchanged"
    [ ! -e "$file-journal" ]
}

@test "fault_48 host store: no database" {
    spoil "$TOVI_ROOT/host.db" malformed
    expect_refused "$TOVI_ROOT/host.db" malformed lumo orkaprovider add --vp-name lab --vp-url u
    expect_refused "$TOVI_ROOT/host.db" malformed lumo orkaprovider set --vp-name lab
}

@test "fault_51 host store: another program's" {
    spoil "$TOVI_ROOT/host.db" foreign
    expect_refused "$TOVI_ROOT/host.db" foreign lumo orkaprovider add --vp-name lab --vp-url u
    expect_refused "$TOVI_ROOT/host.db" foreign lumo orkaprovider remove --vp-name lab
}

@test "fault_51 host store: a newer version's" {
    lumo orkaprovider add --vp-name lab --vp-url u
    spoil "$TOVI_ROOT/host.db" newer
    expect_refused "$TOVI_ROOT/host.db" newer lumo orkaprovider add --vp-name other --vp-url u
    expect_refused "$TOVI_ROOT/host.db" newer lumo orkaprovider remove --vp-name lab
}

@test "fault_48 host store: cut off" {
    lumo orkaprovider add --vp-name lab --vp-url u
    spoil "$TOVI_ROOT/host.db" truncated
    expect_refused "$TOVI_ROOT/host.db" truncated lumo orkaprovider add --vp-name other --vp-url u
}

@test "host store: a directory in its place" {
    mkdir "$TOVI_ROOT/host.db"
    lumo orkaprovider add --vp-name lab --vp-url u
    expect_failure 1 "$TOVI_ROOT/host.db"
    [ -d "$TOVI_ROOT/host.db" ]
}

# The daemon opens the array file; the command shows what it says of it.
for_array_file() {
    host_up
    array="$LUMO_ARRAY_FILE"
    spoil "$array" "$1"
    register_provider
    expect_refused "$array" "$1" lumo storagecontainer load
}

@test "fault_48 array file: no database" {
    for_array_file malformed
}

@test "fault_51 array file: another program's" {
    for_array_file foreign
}

@test "fault_51 array file: a newer version's" {
    for_array_file newer
}

@test "fault_48 array file: cut off" {
    for_array_file truncated
}

@test "array file: missing, and not made" {
    host_up
    register_provider lab "file://$TOVI_ROOT/arrays/missing.array"
    lumo storagecontainer load
    [ "$status" -ne 0 ]
    expect_out ""
    expect_err_has "$TOVI_ROOT/arrays/missing.array"
    [ ! -e "$TOVI_ROOT/arrays/missing.array" ]
}

@test "the daemon neither makes nor changes a host store that it cannot read" {
    host_up
    [ ! -e "$TOVI_ROOT/host.db" ]
    spoil "$TOVI_ROOT/host.db" malformed
    expect_refused "$TOVI_ROOT/host.db" malformed lumo storagecontainer load
}
