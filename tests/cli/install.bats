#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What `cmake --install` leaves runs from where it was put, without the build's directory.
load helper

setup_file() {
    cmake --install "$TOVI_BUILD_DIR" --prefix "$BATS_FILE_TMPDIR/usr" >"$BATS_FILE_TMPDIR/log" 2>&1 || {
        cat "$BATS_FILE_TMPDIR/log" >&2
        return 1
    }
}

setup() {
    installed="$BATS_FILE_TMPDIR/usr"
    PATH="$installed/bin:$PATH"
}

teardown() {
    host_down
}

@test "an installed host mounts its containers" {
    host_up --build "$installed"
    [ "$(command -v tovicli)" = "$installed/bin/tovicli" ]
    tovi storage internal lumo orkaprovider add --vp-name lab --vp-url "$LUMO_ARRAY_URL"
    expect_status 0
    tovi --format csv --fields "StorageContainer Name" storage internal lumo storagecontainer load
    expect_status 0
    expect_err ""
    [ "$(tail -n +2 "$out" | tr -d '\r' | sort | paste -sd ' ')" = "archive gold silver" ]
    tovi --format json cli plugin list
    expect_status 0
    run ! grep -q "$TOVI_BUILD_DIR" "$out"
}

@test "nothing installed looks for libraries in the build's directory" {
    files=("$installed"/bin/* "$installed"/lib/*.so.1 "$installed"/lib/tovicli/*.so "$installed"/lib/tovicli/plugins/*.so)
    [ "${#files[@]}" -eq 10 ]
    for file in "${files[@]}"; do
        readelf -dW "$file" >"$out"
        run ! grep -F "$TOVI_BUILD_DIR" "$out"
        run ! grep -E 'R(UN)?PATH.*\[[^$]' "$out"
    done
}

@test "manual pages, units and the shells' completions come along" {
    [ -f "$installed/share/man/man8/lumod.8" ]
    [ -f "$installed/share/man/man1/tovicli-storage-internal-lumo-storagecontainer-load.1" ]
    cmp "$top/apps/lumod/systemd/lumod.service" "$installed/lib/systemd/system/lumod.service"
    cmp "$top/apps/lumod/systemd/lumod.socket" "$installed/lib/systemd/system/lumod.socket"
    cmp <(tovicli cli completion bash) "$installed/share/bash-completion/completions/tovicli"
    cmp <(tovicli cli completion zsh) "$installed/share/zsh/vendor-completions/_tovicli"
    cmp <(tovicli cli completion fish) "$installed/share/fish/vendor_completions.d/tovicli.fish"
}
