#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Plug-ins: what there is, and why one is not used.
load helper

setup() {
    host_without_daemon
    plugins="$BATS_TEST_TMPDIR/plugins"
    mkdir -m 755 "$plugins"
    cp "$TOVI_BUILD_DIR/lib/tovicli/plugins/liblumointernal.so" "$plugins/a.so"
    chmod 755 "$plugins/a.so"
}

@test "a plug-in that is loaded, and one that is not, with the reason" {
    echo "no library" >"$plugins/b.so"
    cp "$plugins/a.so" "$plugins/c.so"
    tovi --format json --plugins "$plugins" cli plugin list
    expect_status 0
    expect_err ""
    expect_json '[(p["File"].split("/")[-1], p["State"]) for p in d] == [("a.so", "loaded"), ("b.so", "skipped"), ("c.so", "failed")]'
    expect_json 'd[0]["ABI"] == "libplexa.so.1 libkestrel.so.1 liblumo.so.1" and d[0]["Reason"] is None'
    expect_json 'd[1]["Reason"] == "it is no ELF file" and d[1]["ABI"] is None'
    expect_json '"already taken" in d[2]["Reason"]'
}

@test "of a directory that others can write nothing is loaded, and the list says so" {
    chmod 777 "$plugins"
    tovi --format json --plugins "$plugins" cli plugin list
    expect_status 0
    expect_json 'd[0]["State"] == "skipped" and d[0]["Reason"] == "nothing is loaded from its directory"'
    expect_err_has "can be written by others"
}

@test "a check of a good plug-in finds nothing" {
    tovi --format json --plugins "$plugins" cli plugin check --file "$plugins/a.so"
    expect_done $'[]\n'
}

@test "a check names everything that speaks against a plug-in, and ends with status 1" {
    echo "no library" >"$plugins/b.txt"
    chmod 666 "$plugins/b.txt"
    tovi --format json --plugins "$plugins" cli plugin check --file "$plugins/b.txt"
    expect_status 1
    expect_json '[f["Check"] for f in d] == ["file", "permissions", "elf"]'
    expect_err_has "would not be used: 3 findings"
}

@test "a check finds the names that another plug-in has taken" {
    cp "$plugins/a.so" "$plugins/b.so"
    tovi --format json --plugins "$plugins" cli plugin check --file "$plugins/b.so"
    expect_status 1
    expect_json 'all(f["Check"] == "name" for f in d) and len(d) == 23'
}
