#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
#
# What a provider on the network may do wrong, as the user of a whole host sees it: one line, a status, and an end in time.
load helper

gold=3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001

setup() {
    host_up
    behind="$BATS_TEST_TMPDIR/behind.array"
    orkasim make "$top/lab/topologies/small.json" "$behind" >/dev/null
}

# provider_that OPTIONS...: the host's only provider is a server that does this.
provider_that() {
    serve_array "$behind" "$@"
    pin_certificate "$TOVI_ROOT/certs"
    lumo orkaprovider add --vp-name lab --vp-url "$url"
    expect_status 0
    authority="${url#https://}"
    authority="${authority%/orka}"
}

# mounted_provider: a provider without fault, whose containers are mounted. turns_to makes it another one.
mounted_provider() {
    provider_that
    load_containers
}

# turns_to OPTIONS...: the same provider, at the same place, from now on does this.
turns_to() {
    local listen="$authority"
    serve_array "$behind" --listen "$listen" "$@"
    [ "$url" = "https://$listen/orka" ]
}

# load_fails STATUS TIMEOUT TEXT: soon after the timeout at the latest, with one line on standard error that tells this.
load_fails() {
    local begun=$SECONDS
    lumo storagecontainer load --timeout "${2}s"
    [ $((SECONDS - begun)) -le $(($2 + 4)) ] || mismatch "an end within $2 s"
    expect_failure "$1" "tovicli: Unable to load Lumo datastores: $3"
    [ "$(wc -l <"$err")" = 1 ]
}

# volumes_named NAME: how many the array holds.
volumes_named() {
    sqlite3 "$behind" "SELECT count(*) FROM volume WHERE directory_name = '$1'"
}

@test "fault_35 a provider that accepts and never answers costs the timeout" {
    provider_that --misbehave hang --on queryStorageContainer
    load_fails 3 1 "the provider at $authority did not answer queryStorageContainer before the deadline (--timeout gives it more time)"
    lumo daemon set --log-level info
    expect_done $'true\n'
}

@test "fault_36 a provider that drips costs the timeout" {
    provider_that --misbehave drip --on queryStorageContainer
    load_fails 3 3 "the provider at $authority did not finish its answer to queryStorageContainer before the deadline"
}

@test "fault_37 a body without end is cut off" {
    for misdeed in endless huge; do
        provider_that --misbehave "$misdeed" --on queryStorageContainer
        load_fails 1 20 "the provider at $authority answered queryStorageContainer with more than the 16 MiB that an answer may have"
        lumo orkaprovider remove --vp-name lab
        expect_status 0
    done
    # What it sent is not kept.
    resident="$(sed -n 's/^VmHWM:[^0-9]*\([0-9]*\) kB$/\1/p' "/proc/$(cat "$TOVI_ROOT/run/lumod.pid")/status")"
    [ "$resident" -lt 200000 ]
}

@test "fault_38 a body that unpacks to more is refused" {
    provider_that --misbehave bomb --on queryStorageContainer
    load_fails 1 20 "the provider at $authority answered queryStorageContainer in an encoding that it was not asked for"
}

@test "fault_39 garbage and half a document are told by their place" {
    provider_that --misbehave garbage --on queryStorageContainer
    load_fails 1 20 "the provider at $authority gave an answer that is not what it should be: queryStorageContainer: line 1, column 1"
    lumo orkaprovider remove --vp-name lab
    provider_that --misbehave truncated --on queryStorageContainer
    load_fails 1 20 "the provider at $authority gave an answer that is not what it should be: queryStorageContainer: line 1, column 52"
}

@test "fault_40 a certificate that is expired, another host's or nobody's is refused" {
    provider_that
    rm -r "$TOVI_ROOT/certs"
    load_fails 1 20 "the provider at $authority "
    expect_err_has "certificate"
    for option in --expired-cert --cert-name=elsewhere.example; do
        lumo orkaprovider remove --vp-name lab
        rm "$BATS_TEST_TMPDIR"/serve.*.pem
        provider_that "$option"
        load_fails 1 20 "the provider at $authority "
        expect_err_has "certificate"
    done
}

@test "fault_41 a redirect is refused" {
    provider_that --misbehave redirect --on queryStorageContainer
    load_fails 1 20 "the provider at $authority answered queryStorageContainer with a redirect (307), which is refused"
}

@test "fault_42 connections that break after the array has done it: every change is done once" {
    mounted_provider
    for operation in createVirtualVolume bindVirtualVolume deleteVirtualVolume; do
        turns_to --misbehave reset --times 2 --on "$operation"
        lumo configlumo add -n "vm-$operation" -c "$gold"
        expect_done $'true\n'
        [ "$(volumes_named "vm-$operation")" = 1 ]
        lumo configlumo mount -n "vm-$operation" -c "$gold"
        expect_done $'true\n'
        echo content >"$TOVI_ROOT/volumes/gold/vm-$operation/file"
        lumo configlumo umount -n "vm-$operation" -c "$gold"
        expect_done $'true\n'
        lumo configlumo mount -n "vm-$operation" -c "$gold"
        expect_done $'true\n'
        [ "$(cat "$TOVI_ROOT/volumes/gold/vm-$operation/file")" = content ]
        lumo configlumo remove -n "vm-$operation" -c "$gold"
        expect_done $'true\n'
        [ "$(volumes_named "vm-$operation")" = 0 ]
    done
    turns_to --misbehave reset --times 2 --on unbindVirtualVolume
    lumo configlumo add -n vm -c "$gold"
    lumo configlumo mount -n vm -c "$gold"
    lumo configlumo umount -n vm -c "$gold"
    lumo daemon set --unbind-now
    expect_done $'true\n'
    [ "$(sqlite3 "$behind" "SELECT bound_to IS NULL FROM volume WHERE directory_name = 'vm'")" = 1 ]
}

@test "fault_42 an array that never gets to answer: the failure is told, and the command repeated finds it done" {
    mounted_provider
    turns_to --misbehave reset --on createVirtualVolume
    lumo configlumo add -n vm -c "$gold"
    expect_failure 1 "the provider at $authority answered createVirtualVolume by breaking the connection"
    [ "$(volumes_named vm)" = 1 ]
    turns_to
    lumo configlumo add -n vm -c "$gold"
    expect_failure 1 "has a config volume 'vm' already"
    lumo configlumo mount -n vm -c "$gold"
    expect_done $'true\n'
    lumo configlumo remove -n vm -c "$gold"
    expect_done $'true\n'
    [ "$(volumes_named vm)" = 0 ]
}

@test "fault_42 a server that is killed while hosts ask it, and comes back" {
    mounted_provider
    tovicli storage internal lumo configlumo add -n vm -c "$gold" >"$out" 2>"$err" 3>&- &
    asking=$!
    kill -KILL "$array_server"
    wait "$array_server" || true
    array_server=""
    status=0
    wait "$asking" || status=$?
    there="$(volumes_named vm)"
    if [ "$status" -eq 0 ]; then
        [ "$there" = 1 ]
    else
        expect_err_has "the provider at $authority "
        [ "$there" -le 1 ]
    fi
    turns_to
    if [ "$there" = 0 ]; then
        lumo configlumo add -n vm -c "$gold"
        expect_done $'true\n'
    fi
    lumo configlumo mount -n vm -c "$gold"
    expect_done $'true\n'
}

@test "fault_43 a short storm of refusals passes unnoticed, a long one is told in the array's words" {
    mounted_provider
    turns_to --misbehave unavailable --times 3 --on createVirtualVolume
    lumo configlumo add -n vm -c "$gold"
    expect_done $'true\n'
    turns_to --misbehave unavailable --on createVirtualVolume
    begun=$SECONDS
    lumo configlumo add -n other -c "$gold"
    expect_failure 1 "the array is overloaded"
    [ $((SECONDS - begun)) -le 10 ]
    [ "$(volumes_named other)" = 0 ]
}

# lumod_without_names: this root's lumod among name servers that never answer, in a network and with a resolv.conf of its own.
lumod_without_names() {
    local -a alone=(unshare --mount --net)
    [ "$EUID" -eq 0 ] || alone+=(--map-root-user)
    "${alone[@]}" true 2>/dev/null || skip "no namespaces can be made here"
    echo "nameserver 127.0.0.1" >"$BATS_TEST_TMPDIR/resolv.conf"
    mkfifo "$BATS_TEST_TMPDIR/ready"
    # The silent name server is a socket that lumod inherits and does not know of.
    # shellcheck disable=SC2016  # the inner shell's
    "${alone[@]}" sh -c 'mount --bind "$0" /etc/resolv.conf && exec python3 -c "$1" "$2" "$3"' "$BATS_TEST_TMPDIR/resolv.conf" '
import fcntl, os, socket, struct, sys
names = socket.socket(socket.AF_INET, socket.SOCK_DGRAM)
fcntl.ioctl(names, 0x8914, struct.pack("16sh14x", b"lo", 1))  # SIOCSIFFLAGS, IFF_UP
names.bind(("127.0.0.1", 53))
os.set_inheritable(names.fileno(), True)
os.execv(sys.argv[1], [sys.argv[1], "--root", sys.argv[2]])' "$TOVI_BUILD_DIR/bin/lumod" "$TOVI_ROOT" \
        >"$BATS_TEST_TMPDIR/ready" 2>"$BATS_TEST_TMPDIR/lumod.err" 3>&- &
    array_server=$! # ended with the test, as a server is
    read -r _ <"$BATS_TEST_TMPDIR/ready"
}

@test "fault_44 a look-up that hangs costs the timeout, and others less" {
    host_down
    lumod_without_names
    lumo orkaprovider add --vp-name lost --vp-url https://array.example:8443/orka
    expect_status 0
    load_fails 3 1 "the provider at array.example:8443 was not found before the deadline of queryStorageArray: its name is still being looked up"
    lumo orkaprovider add --vp-name lab --vp-url "$LUMO_ARRAY_URL"
    json_of storagecontainer load --timeout 8s
    expect_status 0
    expect_json 'len(d) == 3'
}
