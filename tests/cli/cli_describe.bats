#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
# What a command takes and gives, for programs.
load helper

# described PATH...: leaves what `cli describe` says in $description.
described() {
    tovi cli describe "$@"
    expect_status 0
    expect_err ""
    description="$BATS_TEST_TMPDIR/description"
    cp "$out" "$description"
}

# expect_valid PATH... -- ARGS...: the command's real result is as its description says.
expect_valid() {
    local path=()
    while [ "$1" != -- ]; do
        path+=("$1")
        shift
    done
    shift
    described "${path[@]}"
    tovi --format json "${path[@]}" "$@"
    "$top/tests/cli/validate_schema.py" "$description" "$out" || mismatch "a result as ${path[*]} declares it"
}

@test "parameters stand as they are declared" {
    host_without_daemon
    described storage internal lumo orkaprovider add
    expect_json 'd["path"] == "storage internal lumo orkaprovider add"'
    expect_json 'd["plugin"] == "liblumointernal.so"'
    expect_json '[p["name"] for p in d["parameters"]] == ["vp-name", "vp-url", "arrayid", "priority", "isactive"]'
    expect_json 'd["parameters"][0] == {"name": "vp-name", "alias": "v", "type": "string", "required": True, "description": "Orka Provider Name"}'
    expect_json '[p["type"] for p in d["parameters"]][2:] == ["list of strings", "list of integers", "list of booleans"]'
}

@test "the path may also be given by --path, word by word" {
    host_without_daemon
    described cli doctor
    tovi cli describe --path cli --path doctor
    cmp "$out" "$description"
}

@test "a namespace describes every command in it, the root all" {
    host_without_daemon
    tovi cli describe storage internal lumo configlumo
    expect_json '[c["path"].split()[-1] for c in d["commands"]] == ["add", "remove", "umount", "mount"]'
    tovi cli describe
    expect_json 'len(d["commands"]) == 29 and d["namespace"] is None'
}

@test "a word that names nothing is a usage error with what is near it" {
    host_without_daemon
    tovi cli describe storage internal lumo orkaprovidr
    expect_failure 2 "unknown word 'orkaprovidr' in 'storage internal lumo'; did you mean 'orkaprovider'?"
}

@test "real results are as their descriptions say" {
    host_up
    register_provider
    expect_valid storage internal lumo storagecontainer load --
    expect_json 'len(d) == 3 and len(d[0]["Arrays"]) > 0'
    expect_valid storage internal lumo storagecontainer load -- # an empty list
    expect_json 'd == []'
    expect_valid storage internal lumo storagecontainer checklumos -- --path "$TOVI_ROOT/volumes/silver"
    expect_valid storage internal lumo virtualvolume get -- -c 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002 \
        -u a1b20002-2222-4bbb-8bbb-000000000001
    expect_valid storage internal lumo virtualvolume metadata list -- -c 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002 \
        -u a1b20002-2222-4bbb-8bbb-000000000001
    expect_valid storage internal lumo daemon set -- --log-level info
    expect_valid cli doctor --
    expect_valid cli command list --
    expect_valid cli plugin list --
}

@test "what a schema refuses is refused" {
    host_without_daemon
    described cli doctor
    for wrong in '[{"Check": "a", "State": "ok"}]' '[{"Check": 1, "State": "ok", "Detail": "b"}]' '{}' \
        '[{"Check": "a", "State": "ok", "Detail": "b", "More": "c"}]'; do
        printf '%s' "$wrong" >"$out"
        run -1 "$top/tests/cli/validate_schema.py" "$description" "$out"
    done
    printf '[{"Check": null, "State": "ok", "Detail": "b"}]' >"$out"
    "$top/tests/cli/validate_schema.py" "$description" "$out"
}
