#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    mounted_host
}

# Containers whose array has the endpoint, in the order that the command tells them.
expect_notice() {
    expect_status 1
    expect_out ""
    expect_err_has "Notify PE APD command returned containers: "
}

@test "a log level" {
    for level in panic quiet error warning info verbose TRIVIA loud; do
        lumo daemon set --log-level "$level"
        expect_done $'true\n'
    done
}

@test "the objects are dumped to the daemon's log" {
    lumo daemon set --dump-objects
    expect_done $'true\n'
    grep -qF '"object":"provider","name":"lab"' "$TOVI_ROOT/log/lumod.log"
}

@test "an unbind period" {
    lumo daemon set --unbind-period 1000000 -l info -d
    expect_done $'true\n'
}

# A notice is a message without a completed output, so its status is that of a failure.
@test "all paths down names the endpoint's containers" {
    lumo daemon set --start-pe-apd "$endpoint"
    expect_notice
    expect_err_has "$container_name, "
    lumo daemon set --end-pe-apd "$endpoint"
    expect_notice
}

@test "an endpoint that nobody knows" {
    lumo daemon set --start-pe-apd nowhere
    expect_failure 1
    [ -s "$err" ]
}

@test "all paths down comes before everything else that is given" {
    lumo daemon set --log-level info --start-pe-apd "$endpoint" --end-pe-apd "$endpoint"
    expect_notice
    json_of storagecontainer checklumos -p "$TOVI_ROOT/volumes/$container_name"
    expect_status 0
}

@test "with space-efficiency commands off a profile is left as it is" {
    lumo daemon set --disable-spm-space-efficiency-cmds true
    expect_done $'true\n'
    lumo configlumo add -n plain -c "$container" -p gold
    lumo daemon set --disable-spm-space-efficiency-cmds=false
    expect_done $'true\n'
    lumo configlumo add -n thin -c "$container" -p gold
    expect_status 0
    [ "$(sqlite3 "$LUMO_ARRAY_FILE" "SELECT profile FROM volume WHERE directory_name IN ('plain', 'thin')
        ORDER BY directory_name")" = $'gold\ngold;alloctype=thin' ]
}

@test "in JSON the result is true" {
    json_of daemon set --log-level info
    expect_status 0
    expect_json 'd is True'
}

@test "nothing given" {
    lumo daemon set
    expect_failure 1 "At least one of the parameters --log-level, --dump-objects, --unbind-period, --unbind-now, --start-pe-apd, --end-pe-apd, --disable-spm-space-efficiency-cmds is needed"
}

@test "without a daemon it fails with its cause" {
    host_down
    lumo daemon set --log-level info
    expect_failure 3 "LumoLib_DebugCommand  failed with error the daemon is not running" "$TOVI_ROOT/run/lumod.sock"
    lumo daemon set --disable-spm-space-efficiency-cmds true
    expect_failure 3 "LumoLib_SetSPMSpaceEfficiencyManipulationEnabled failed with error, the daemon is not running"
}
