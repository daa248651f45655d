#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# Every format through the real tool: what people see, and what parsers that are not ours read from a pipe.
load helper

setup() {
    host_up
    register_provider
}

# piped FORMAT EXPRESSION ARGS...: what the expression makes of the document that the command wrote into a pipe.
piped() {
    (
        set -o pipefail
        tovicli --format "$1" storage internal lumo "${@:3}" 2>"$err" | python3 "$top/tests/cli/formats.py" "$1" "$2"
    )
}

@test "json: containers with their types" {
    run -0 piped json '[(c["StorageContainer Name"], c["Max Lumo Size (MB)"], len(c["Arrays"])) for c in d]' storagecontainer load
    [ "$output" = "[('gold', 4194304, 1), ('silver', 1048576, 2), ('archive', 2048, 1)]" ]
}

@test "yaml: the same types as json" {
    run -0 piped yaml '[(c["StorageContainer Name"], c["Max Lumo Size (MB)"], len(c["Arrays"])) for c in d]' storagecontainer load
    [ "$output" = "[('gold', 4194304, 1), ('silver', 1048576, 2), ('archive', 2048, 1)]" ]
    run -0 piped yaml 'd' storagecontainer load
    [ "$output" = "[]" ]
}

@test "xml: elements named after their types" {
    run -0 piped xml '[(c.find("text[@key='"'StorageContainer Name'"']").text, int(c.find("int").text), len(c.find("list[@key='"'Arrays'"']"))) for c in d.findall("list/record[@type='"'StorageContainer'"']")]' storagecontainer load
    [ "$output" = "[('gold', 4194304, 1), ('silver', 1048576, 2), ('archive', 2048, 1)]" ]
}

@test "csv: a row for each container, arrays as json in their cell" {
    run -0 piped csv '[(c["StorageContainer Name"], c["Max Lumo Size (MB)"], len(json.loads(c["Arrays"]))) for c in d]' storagecontainer load
    [ "$output" = "[('gold', '4194304', 1), ('silver', '1048576', 2), ('archive', '2048', 1)]" ]
    tovi --format csv storage internal lumo storagecontainer load
    expect_done $'StorageContainer Name,StorageContainer Id,Max Lumo Size (MB),VP URL,Arrays\r\n'
}

@test "keyvalue: a line for each value, found by its path" {
    run -0 piped keyvalue '(d["[0].StorageContainer Name"], d["[1].Max Lumo Size (MB)"], d["[2].Arrays[0].ArrayId"])' storagecontainer load
    [ "$output" = "('gold', 1048576, 'array-south')" ]
}

@test "simple and tree: the fields asked for, under the container's name" {
    tovi --format tree --fields "StorageContainer Id,Max Lumo Size (MB)" storage internal lumo storagecontainer load
    expect_status 0
    expect_out - <<'END'
gold
├── StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
└── Max Lumo Size (MB): 4194304
silver
├── StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002
└── Max Lumo Size (MB): 1048576
archive
├── StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9003
└── Max Lumo Size (MB): 2048
END
}

@test "table: columns of its own, and the ones that the user names" {
    tovi --format table --format-param "table-columns=StorageContainer Name,Max Lumo Size (MB)" \
        --format-param "units:StorageContainer.Max Lumo Size (MB)=MB" storage internal lumo storagecontainer load
    expect_status 0
    expect_out - <<'END'
StorageContainer Name  Max Lumo Size (MB)
---------------------  ------------------
gold                           4194304 MB
silver                         1048576 MB
archive                           2048 MB
END
}

@test "a command that only succeeds, in every format" {
    load_containers
    local format expected
    while read -r format expected; do
        tovi --format "$format" storage internal lumo orkacontext set --uuid 0123-4567
        expect_done "$(printf '%b.' "$expected" | sed 's/\.$//')"$'\n'
    done <<'END'
simple true
table true
tree true
json true
yaml ---\ntrue
xml <?xml version="1.0" encoding="UTF-8"?>\n<result>\n  <bool>true</bool>\n</result>
csv result\r\ntrue\r
keyvalue result=true
END
}

@test "a structure with units, in every format" {
    load_containers
    container=3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    lumo configlumo add -n vm -c "$container" -s 128 -p gold
    expect_status 0
    local get format
    get=(virtualvolume get -c "$container" -u "$(volume_uuid vm)")
    for format in json yaml; do
        run -0 piped "$format" 'list(d.values())[:3]' "${get[@]}"
        [ "$output" = "['$container', '$(volume_uuid vm)', 128]" ]
    done
    run -0 piped xml '[e.tag for e in d.find("record")], d.findtext("record/int[@key='"'Logical Size'"']")' "${get[@]}"
    [ "$output" = "(['text', 'text', 'int', 'int', 'bool', 'int', 'text', 'int'], '128')" ]
    run -0 piped csv 'd[0]["Logical Size"]' "${get[@]}"
    [ "$output" = 128 ]
    run -0 piped keyvalue 'd["Logical Size"]' "${get[@]}"
    [ "$output" = 128 ]
    for format in simple tree; do
        tovi --format "$format" storage internal lumo "${get[@]}"
        expect_status 0
        expect_out_has "Logical Size: 128 MB"
    done
    tovi --format table storage internal lumo "${get[@]}"
    expect_status 0
    expect_out_has "128 MB"
}

@test "an unknown field, structure or format is a usage error that says what is near, and nothing was done" {
    tovi --fields "StorageContainer Nmae" storage internal lumo storagecontainer load
    expect_failure 2 "--fields: 'StorageContainer Nmae' is no field of the result; did you mean 'StorageContainer Name'"
    tovi --fields "Arrays,Arrays" storage internal lumo storagecontainer load
    expect_failure 2 "--fields: 'Arrays' is named twice"
    tovi --format-param "fields:Aray=Name" storage internal lumo storagecontainer load
    expect_failure 2 "--format-param: 'Aray' is no structure of the result; did you mean 'Array'?"
    tovi --format ymal storage internal lumo storagecontainer load
    expect_failure 2 "--format: unknown format 'ymal'; did you mean 'yaml'"
    run -0 piped json 'len(d)' storagecontainer load
    [ "$output" = 3 ]
}

@test "a file system that tells of a lost write on closing only is believed" {
    traced -qq -o /dev/null -P "$out" -e trace=close -e inject=close:error=EDQUOT:when=1 \
        tovicli storage internal lumo orkacontext set --uuid 0123-4567 >"$out" 2>"$err" || status=$?
    expect_status 4
    expect_err_has "cannot write the output: Disk quota exceeded" "the command itself was completed"
}

@test "fault_63 every format: a full disk is status 4 and one clear line" {
    local format
    for format in simple table tree json yaml xml csv keyvalue; do
        status=0
        tovicli --format "$format" storage internal lumo orkacontext set --uuid 0123-4567 >/dev/full 2>"$err" || status=$?
        : >"$out"
        expect_status 4
        expect_err_has "cannot write the output: No space left on device" "the command itself was completed"
        [ "$(wc -l <"$err")" -eq 1 ]
    done
}

@test "fault_63 every format: a reader that goes away is status 4, however far the document was" {
    # More than a pipe holds (64 KiB) in every format, and few enough to be mounted eight times.
    "$top/lab/generate-topology" --containers 80 --arrays 2 --endpoints 4 >"$BATS_TEST_TMPDIR/large.json"
    host_down
    rm -rf "$BATS_TEST_TMPDIR/host"
    host_up --topology "$BATS_TEST_TMPDIR/large.json" --name large
    register_provider
    cp "$TOVI_ROOT/host.db" "$BATS_TEST_TMPDIR/registered.db"
    local format
    for format in simple table tree json yaml xml csv keyvalue; do
        rm -rf "$TOVI_ROOT/volumes"
        cp "$BATS_TEST_TMPDIR/registered.db" "$TOVI_ROOT/host.db"
        (
            status=0
            tovicli --format "$format" storage internal lumo storagecontainer load 2>"$err" || status=$?
            echo "$status" >"$BATS_TEST_TMPDIR/status"
        ) | head -c 1000 >"$out"
        status="$(cat "$BATS_TEST_TMPDIR/status")"
        expect_status 4
        expect_err_has "cannot write the output: Broken pipe" "the command itself was completed"
    done
}
