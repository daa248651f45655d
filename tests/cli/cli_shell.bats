#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Many command lines in one process: from standard input, and typed.
load helper
load terminal

teardown() {
    terminal_stop
    host_down
}

# shell LINES [OPTIONS]: runs the lines; leaves $status, $out and $err as tovi does.
shell() {
    local lines="$1"
    shift
    status=0
    printf '%s' "$lines" | tovicli "${globals[@]}" cli shell "$@" >"$out" 2>"$err" || status=$?
}

# wait_for FILE TEXT: waits until the file holds the text.
wait_for() {
    local limit=$((SECONDS + 30))
    until grep -qF -- "$2" "$1"; do
        [ "$SECONDS" -lt "$limit" ] || mismatch "$1 to hold: $2" || return 1
        timeout 0.05 tail -f /dev/null 3>&- || true
    done
}

setup() {
    globals=()
    host_without_daemon
    export TOVI_OFFLINE=1
    lumo="storage internal lumo"
}

@test "lines are run in order; blank ones and comments are not" {
    shell "# a comment

$lumo orkaprovider add --vp-name 'my lab' --vp-url \"file:///x\" # behind it
   tovicli $lumo orkaprovider remove --vp-name my\\ lab
"
    expect_done $'Succesfully Added VP with name : my lab\ntrue\n'
}

@test "without lines there is nothing to do" {
    shell ""
    expect_done ""
}

@test "no prompt where nobody types" {
    shell $'--version\n'
    expect_done $'tovicli 1.0.0\n'
}

@test "the first failure stops, and its status is the shell's" {
    shell "$lumo orkaprovider remove --vp-name none
--version
"
    expect_failure 1 "line 1"
    shell $'--version\nnonsense\n--version\n'
    expect_status 2
    expect_out $'tovicli 1.0.0\n'
    expect_err_has "unknown word 'nonsense'" "stopped at line 2, which failed"
    unset TOVI_OFFLINE
    shell "$lumo storagecontainer load"$'\n'
    expect_failure 3 "$TOVI_ROOT/run/lumod.sock"
}

@test "--keep-going runs the rest, with the status of the first failure" {
    shell "$lumo orkaprovider remove --vp-name none
nonsense
--version
" --keep-going
    expect_status 1
    expect_out $'tovicli 1.0.0\n'
    expect_err_has "unknown word 'nonsense'"
}

@test "what only a shell does is refused, with the line's number" {
    shell $'--version\n--version | less\n'
    expect_status 2
    expect_err_has "line 2: '|' is for a shell and means nothing here; quote it if it is text"
    shell $'--version "x\n'
    expect_failure 2 'line 1: a " is not closed'
}

@test "exit ends, and a shell in a shell is refused" {
    shell $'exit\n--version\n'
    expect_done ""
    shell $'cli shell\n'
    expect_failure 2 "a shell is running already"
}

@test "options of the shell hold for each line that has none of its own, and a line's for that line alone" {
    globals=(--format json)
    shell "$lumo orkacontext set --clear
--format simple $lumo orkacontext set --clear
--root $BATS_TEST_TMPDIR/other $lumo orkaprovider add --vp-name elsewhere --vp-url u
$lumo orkaprovider add --vp-name here --vp-url u
"
    expect_status 0
    expect_out $'true\ntrue\n"Succesfully Added VP with name : elsewhere\\n"\n"Succesfully Added VP with name : here\\n"\n'
    [ "$(stored_providers)" = "here|u" ]
    [ "$(TOVI_ROOT="$BATS_TEST_TMPDIR/other" stored_providers)" = "elsewhere|u" ]
}

@test "in a machine format each result is one document" {
    unset TOVI_OFFLINE
    host_up
    register_provider
    globals=(--format json)
    shell "$lumo storagecontainer load
$lumo storagecontainer load
cli plugin list
"
    expect_status 0
    python3 -c 'import json, sys
text, documents = open(sys.argv[1]).read().strip(), []
while text:
    document, end = json.JSONDecoder().raw_decode(text)
    documents.append(document)
    text = text[end:].lstrip()
assert [len(d) for d in documents] == [3, 0, 1], documents' "$out"
}

@test "one process and one session: the daemon is connected to once for many lines" {
    unset TOVI_OFFLINE
    host_up
    for ((i = 0; i < 20; i++)); do
        echo "$lumo daemon set --log-level info"
    done >"$BATS_TEST_TMPDIR/lines"
    traced -f -e trace=connect,execve -o "$BATS_TEST_TMPDIR/trace" tovicli cli shell <"$BATS_TEST_TMPDIR/lines" >"$out"
    [ "$(grep -c true "$out")" -eq 20 ]
    [ "$(grep -c 'connect(' "$BATS_TEST_TMPDIR/trace")" -eq 1 ]
    [ "$(grep -c 'execve(' "$BATS_TEST_TMPDIR/trace")" -eq 1 ]
}

@test "a line's --root is asked at its own daemon" {
    unset TOVI_OFFLINE
    host_up
    shell "$lumo daemon set --log-level info
--root $BATS_TEST_TMPDIR/nowhere $lumo daemon set --log-level info
$lumo daemon set --log-level info
" --keep-going
    expect_status 3
    expect_out $'true\ntrue\n'
    expect_err_has "$BATS_TEST_TMPDIR/nowhere/run/lumod.sock"
}

@test "a daemon that comes back between two lines is found again" {
    unset TOVI_OFFLINE
    mkfifo "$BATS_TEST_TMPDIR/lines"
    tovicli cli shell --keep-going <"$BATS_TEST_TMPDIR/lines" >"$out" 2>"$err" 3>&- &
    shell=$!
    exec 9>"$BATS_TEST_TMPDIR/lines"
    echo "$lumo daemon set --log-level info" >&9
    wait_for "$err" "no daemon answers"
    host_up 9>&- # lumod would hold it open
    echo "$lumo daemon set --log-level info" >&9
    wait_for "$out" true
    exec 9>&-
    status=0
    wait "$shell" || status=$?
    expect_status 3
}

@test "output that cannot be written ends it, also with --keep-going" {
    status=0
    printf '%s\n' --version --version | tovicli cli shell --keep-going >/dev/full 2>"$err" || status=$?
    expect_status 4
    [ "$(grep -c "cannot write the output" "$err")" -eq 1 ]
}

@test "at a terminal: prompt, history, completion, Ctrl-C and Ctrl-D" {
    terminal_start -w 120 -e HOME="$BATS_TEST_TMPDIR" -u XDG_STATE_HOME -u TOVI_HISTORY -- tovicli cli shell
    terminal_expect "tovicli>"
    terminal_keys "sto" Tab "int" Tab "lumo orkap" Tab "add --vp-n" Tab "lab --vp-url u" Enter
    terminal_expect "Succesfully Added VP with name : lab"
    terminal_keys "storage internal lumo orkaprovider remove --vp-n" Tab "l" Tab
    terminal_expect "remove --vp-name lab"
    terminal_keys C-c
    terminal_keys "cli version" C-u "nonsense" Enter
    terminal_expect "unknown word 'nonsense'"
    terminal_keys Up Up
    terminal_expect "tovicli> storage internal lumo orkaprovider add --vp-name lab --vp-url u"
    terminal_keys C-c
    terminal_keys "storage internal lumo orkaprovider " Tab
    terminal_expect "injectfault  Inject Orka Provider"
    terminal_keys C-u " --version" Enter
    terminal_expect "tovicli 1.0.0"
    terminal_keys C-d
    terminal_wait
    expect_status 0
    grep -q "add.*vp-name.*lab" "$BATS_TEST_TMPDIR/.local/state/tovicli/history"
    [ "$(stat -c %a "$BATS_TEST_TMPDIR/.local/state/tovicli/history")" = 600 ]
    [ "$(stored_providers)" = "lab|u" ] # the line that was taken back was not run
}

@test "at a terminal: history lasts, prompts stay off a redirected output, the status is the last line's" {
    export TOVI_HISTORY="$BATS_TEST_TMPDIR/history"
    # shellcheck disable=SC2016 # expanded by the shell in the terminal
    terminal_start -w 100 -- bash -c 'tovicli cli shell >"$1"' bash "$out"
    terminal_expect "tovicli>"
    terminal_keys "--version" Enter
    wait_for "$out" "tovicli 1.0.0"
    terminal_keys "nonsense" Enter C-d
    terminal_wait
    expect_status 2
    expect_out $'tovicli 1.0.0\n'
    terminal_start -w 100 -- tovicli cli shell
    terminal_expect "tovicli>"
    terminal_keys Up Up Enter
    terminal_expect "tovicli 1.0.0"
    terminal_keys "exit" Enter
    terminal_wait
    expect_status 0
}
