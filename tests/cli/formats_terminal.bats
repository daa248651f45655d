#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What formats for people do on a terminal, and not elsewhere: width, colour, lines.
load helper
load terminal

setup() {
    host_up
    register_provider
}

teardown() {
    terminal_stop
    host_down
}

load_in_terminal() {
    terminal_run "$@" storage internal lumo storagecontainer load
    expect_status 0
}

@test "a table is laid out to the terminal's width" {
    load_in_terminal -w 72 -- tovicli --format table --fields "StorageContainer Name,StorageContainer Id,VP URL"
    [ "$(awk '{ if (length > widest) widest = length } END { print widest }' "$screen")" -le 72 ]
    grep -q "^gold " "$screen"
    grep -q "^silver " "$screen"
}

@test "COLUMNS counts before the terminal, and not off it" {
    load_in_terminal -w 200 -e COLUMNS=50 -- tovicli --format table --fields "StorageContainer Id,VP URL"
    [ "$(awk '{ if (length > widest) widest = length } END { print widest }' "$screen")" -le 50 ]
    rm -rf "$TOVI_ROOT/volumes" "$TOVI_ROOT/host.db"
    register_provider
    COLUMNS=50 tovi --format table --fields "StorageContainer Id,VP URL" storage internal lumo storagecontainer load
    expect_status 0
    expect_out_has "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001  file://$TOVI_ROOT/arrays/small.array"
}

@test "headings and labels have colour on a terminal" {
    load_in_terminal -- tovicli --fields "StorageContainer Name,Max Lumo Size (MB)"
    expect_screen - <<'END'
gold
  StorageContainer Name: gold
  Max Lumo Size (MB): 4194304

silver
  StorageContainer Name: silver
  Max Lumo Size (MB): 1048576

archive
  StorageContainer Name: archive
  Max Lumo Size (MB): 2048
END
    grep -q $'^\e\[1mgold' "$colours"
    grep -q $'\e\[36m.*Max Lumo Size (MB):' "$colours"
}

@test "NO_COLOR, a dumb terminal and a pipe have none" {
    load_in_terminal -e NO_COLOR=1 -- tovicli
    run ! grep -q $'\e' "$colours"
    rm -rf "$TOVI_ROOT/volumes" "$TOVI_ROOT/host.db"
    register_provider
    load_in_terminal -e TERM=dumb -- tovicli --format tree --fields "StorageContainer Name"
    run ! grep -q $'\e' "$colours"
    expect_screen - <<'END'
gold
`-- StorageContainer Name: gold
silver
`-- StorageContainer Name: silver
archive
`-- StorageContainer Name: archive
END
    rm -rf "$TOVI_ROOT/volumes" "$TOVI_ROOT/host.db"
    register_provider
    terminal_run -w 40 -- bash -c 'tovicli --format table storage internal lumo storagecontainer load | cat >"$0"' "$BATS_TEST_TMPDIR/piped"
    run ! grep -q $'\e' "$BATS_TEST_TMPDIR/piped"
    grep -q "^gold   *3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001  *4194304  file://$TOVI_ROOT/arrays/small.array$" "$BATS_TEST_TMPDIR/piped"
}

@test "formats for programs are the same on a terminal" {
    terminal_run -w 60 -- tovicli --format json storage internal lumo orkacontext set --uuid 0123-4567
    expect_status 0
    expect_screen $'true\n'
    run ! grep -q $'\e' "$colours"
}

@test "wide, combining and emoji characters take the columns that a table gives them" {
    # A name is printed with a bar behind it, and the terminal tells where the bar came to stand.
    local name width
    while read -r width name; do
        terminal_run -w 60 -- printf '%s|' "$name"
        [ "$(terminal_tmux display-message -p '#{cursor_x}')" -eq "$((width + 1))" ]
    done <<END
4 金額
4 caf$(printf 'e\xcc\x81')
2 😀
3 한a
END
}
