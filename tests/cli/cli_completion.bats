#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Completing command lines in bash, zsh and fish.
load helper
load terminal

teardown() {
    terminal_stop
    host_down
}

# script SHELL: leaves the completion script of a shell in $script.
script() {
    script="$BATS_TEST_TMPDIR/completion.$1"
    tovicli cli completion "$1" >"$script"
}

# in_bash LINE WORD...: what bash would offer for the line, which it breaks into these words; sorted, one a line.
in_bash() {
    # shellcheck disable=SC2016 # expanded by that bash
    bash --norc -c 'source "$1"; shift
        COMP_LINE="$1"; COMP_POINT=${#1}; shift
        COMP_WORDS=("$@"); COMP_CWORD=$(($# - 1))
        _tovicli tovicli "${COMP_WORDS[-1]}"
        printf "%s\n" "${COMPREPLY[@]}"' bash "$script" "$@" 2>"$err" | sort >"$out"
}

# expect_offers LINE-WORDS... -- OFFER...: with bash, for words with blanks between them.
expect_offers() {
    local words=()
    while [ "$1" != -- ]; do
        words+=("$1")
        shift
    done
    shift
    in_bash "${words[*]}" "${words[@]}"
    expect_out "$(printf '%s\n' "$@")"$'\n'
    expect_err ""
}

@test "bash: names, options and fixed values come from the script, without any process" {
    host_without_daemon
    script bash
    export PATH=/usr/bin:/bin # no tovicli to be asked
    expect_offers tovicli "" -- cli storage
    expect_offers tovicli stor -- storage
    expect_offers tovicli storage internal lumo orkaprovider a -- activate add
    expect_offers tovicli storage internal lumo orkaprovider add --vp -- --vp-name --vp-url
    expect_offers tovicli storage internal lumo orkaprovider add -v x -U y "" -- --arrayid --isactive --priority --vp-name --vp-url
    expect_offers tovicli --format js -- json
    expect_offers tovicli storage --format xm -- xml
    expect_offers tovicli storage internal lumo faultInjection enable -e "" -- false true
    expect_offers tovicli storage internal lumo faultInjection rule add --fault TI -- TIMEOUT
    expect_offers tovicli cli completion "" -- bash fish zsh
}

@test "bash: an option that was given is not offered again unless it may be repeated" {
    host_without_daemon
    script bash
    expect_offers tovicli storage internal lumo orkaprovider set --vp-name x --arrayid y --a -- --arrayid
    expect_offers tovicli storage internal lumo orkaprovider set --vp-name x --vp -- ""
}

@test "bash: names that the host knows, however the option is written" {
    needs_file_url
    mounted_host
    script bash
    expect_offers tovicli storage internal lumo orkaprovider set --vp-name "" -- lab
    expect_offers tovicli storage internal lumo orkaprovider set -v l -- lab
    in_bash "tovicli storage internal lumo orkaprovider set --vp-name=l" \
        tovicli storage internal lumo orkaprovider set --vp-name = l
    expect_out $'lab\n'
    in_bash "tovicli storage internal lumo orkaprovider set --vp-name=" \
        tovicli storage internal lumo orkaprovider set --vp-name =
    expect_out $'lab\n'
    in_bash "tovicli storage internal lumo orkaprovider activate -u file:" \
        tovicli storage internal lumo orkaprovider activate -u file :
    expect_out "${LUMO_ARRAY_URL#file:}"$'\n'
    expect_offers tovicli storage internal lumo orkaprovider activate -n lab -a "" -- array-north array-south
    expect_offers tovicli storage internal lumo storagecontainer remove -c 3f -- \
        3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9003
    expect_offers tovicli storage internal lumo storagecontainer checklumos --path "" -- \
        "$TOVI_ROOT/volumes/archive" "$TOVI_ROOT/volumes/gold" "$TOVI_ROOT/volumes/silver"
    expect_offers tovicli storage internal lumo daemon set --start-pe-apd pe-south -- \
        "$(all_endpoints | grep '^pe-south')"
}

@test "bash: config volumes, those that fit the command" {
    mounted_host
    for name in one two; do
        lumo configlumo add --name "$name" --container-id "$container"
        lumo configlumo mount --name "$name" --container-id "$container"
    done
    lumo configlumo umount --name two --container-id "$container"
    expect_status 0
    script bash
    expect_offers tovicli storage internal lumo configlumo umount -c "$container" -n "" -- one
    expect_offers tovicli storage internal lumo configlumo mount -c "$container" -n "" -- two
    expect_offers tovicli storage internal lumo configlumo remove -c "$container" -n "" -- one two
}

@test "bash: names with blanks and quotes arrive quoted" {
    host_without_daemon
    export TOVI_OFFLINE=1
    register_provider "my lab's" file:///x.array
    script bash
    expect_offers tovicli storage internal lumo orkaprovider set -v "" -- "my\\ lab\\'s"
}

@test "bash: the root that the line names is the one that is asked" {
    host_up
    register_provider
    script bash
    other="$TOVI_ROOT"
    export TOVI_ROOT="$BATS_TEST_TMPDIR/none"
    expect_offers tovicli --root "$other" storage internal lumo orkaprovider set -v "" -- lab
    expect_offers tovicli storage internal lumo orkaprovider set -v "" -- ""
}

@test "what is asked while typing is silent, and quick, whatever the host is like" {
    ask=(cli complete --word=storage --word=internal --word=lumo --word=orkaprovider --word=activate --word=-a --word=)
    host_without_daemon
    tovi "${ask[@]}"
    expect_done $'words\n'
    mkdir "$TOVI_ROOT/run"
    python3 -c 'import socket, sys; socket.socket(socket.AF_UNIX).bind(sys.argv[1])' "$TOVI_ROOT/run/lumod.sock"
    tovi "${ask[@]}"
    expect_done $'words\n'
    echo "no store" >"$TOVI_ROOT/host.db"
    tovi "${ask[@]}"
    expect_done $'words\n'
    tovi cli complete --nonsense
    expect_err ""
    tovi cli complete --word=$'\xff'
    expect_err ""
    expect_out ""
}

@test "a daemon that hangs costs a second at most" {
    host_up
    pid="$(cat "$TOVI_ROOT/run/lumod.pid")"
    kill -STOP "$pid"
    started=$EPOCHREALTIME
    tovi cli complete --word=storage --word=internal --word=lumo --word=orkaprovider --word=activate --word=-a --word=
    elapsed=$(((${EPOCHREALTIME/./} - ${started/./}) / 1000))
    kill -CONT "$pid"
    expect_done $'words\n'
    [ "$elapsed" -lt 1500 ] # with room for a busy machine
}

@test "asking changes nothing on the host: an unfinished transaction stays one" {
    host_without_daemon
    export TOVI_OFFLINE=1
    register_provider
    cp "$TOVI_ROOT/host.db" "$TOVI_ROOT/host.db-journal"
    before="$(cksum "$TOVI_ROOT"/*)"
    tovi cli complete --word=storage --word=internal --word=lumo --word=orkaprovider --word=set --word=-v --word=
    [ "$(cksum "$TOVI_ROOT"/*)" = "$before" ]
}

@test "an unknown shell is a usage error" {
    host_without_daemon
    tovi cli completion tcsh
    expect_failure 2 "'tcsh'" "bash, zsh, fish"
    tovi cli completion
    expect_failure 2 "--shell"
}

@test "the scripts are what their shells and shellcheck read" {
    host_without_daemon
    script bash
    bash -n "$script"
    shellcheck -s bash "$script"
    script zsh
    zsh -n "$script"
    script fish
    fish -n "$script"
}

@test "bash: on a terminal, by the Tab key" {
    host_up
    register_provider
    script bash
    terminal_start -w 120 -e HOME="$BATS_TEST_TMPDIR" -- bash --norc --noprofile -i
    terminal_keys "source $script; echo sour''ced" Enter
    terminal_expect "sourced"
    terminal_keys "tovicli stor" Tab "int" Tab "lumo orkap" Tab "se" Tab "--vp-n" Tab "l" Tab
    terminal_expect "tovicli storage internal lumo orkaprovider set --vp-name lab"
    terminal_keys C-u "tovicli storage internal lumo orkaprovider set --vp-name=l" Tab "x"
    terminal_expect "set --vp-name=lab x"
    terminal_keys C-u "exit" Enter
    terminal_wait
}

@test "zsh: on a terminal, by the Tab key" {
    host_up
    register_provider
    script zsh
    terminal_start -w 120 -e HOME="$BATS_TEST_TMPDIR" -- zsh -f -i
    terminal_keys "autoload -Uz compinit && compinit -D -u; source $script; echo sour''ced" Enter
    terminal_expect "sourced"
    terminal_keys "tovicli stor" Tab "int" Tab "lumo orkap" Tab "se" Tab "--vp-n" Tab "l" Tab
    terminal_expect "tovicli storage internal lumo orkaprovider set --vp-name lab"
    terminal_keys C-u "tovicli storage internal lumo orkaprovider set --vp-name=l" Tab "x"
    terminal_expect "set --vp-name=lab x"
    terminal_keys C-u "exit" Enter
    terminal_wait
}

@test "fish: what it offers" {
    host_up
    register_provider
    script fish
    export HOME="$BATS_TEST_TMPDIR"
    offers() {
        fish --no-config -c "source $script; complete -C \"$1\"" >"$out" 2>"$err"
        expect_err ""
    }
    offers "tovicli stor"
    expect_out_has $'storage\tStorage commands.'
    offers "tovicli storage internal lumo orkaprovider set --vp-name "
    expect_out_has $'lab\t'"$LUMO_ARRAY_URL"
    offers "tovicli storage internal lumo faultInjection rule add -o "
    expect_out_has createVirtualVolume '*'
    [ "$(wc -l <"$out")" -eq 12 ]
    offers "tovicli storage internal lumo orkaprovider set --vp"
    expect_out_has "--vp-name"
    offers "tovicli cli describe storage "
    expect_out_has internal
}
