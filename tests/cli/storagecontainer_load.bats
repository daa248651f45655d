#!/usr/bin/env bats
# SPDX-License-Identifier: Apache-2.0
load helper

setup() {
    host_up
    register_provider
}

@test "every exported container is mounted and shown with its arrays and endpoints" {
    lumo storagecontainer load
    expect_status 0
    expect_err ""
    expect_out - <<EOF_OUT
gold
  StorageContainer Name: gold
  StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
  Max Lumo Size (MB): 4194304
  VP URL: $LUMO_ARRAY_URL
  Arrays:
    array-north
      ArrayId: array-north
      Name: North
      VendorId: Tarsel
      ModelId: T-400
      PEInfo:
        PE #0 (localUID: pe-north-scsi-1, isAccessible: 1, isConfigured: 1, type: SCSI, lunID: naa.6001405a0000000000000000000000a1)
        PE #1 (localUID: pe-north-scsi-2, isAccessible: 0, isConfigured: 1, type: SCSI, lunID: naa.6001405a0000000000000000000000a2)
        PE #2 (localUID: pe-north-nfs-1, isAccessible: 1, isConfigured: 1, type: NFS, ipAddress: 192.0.2.10, serverMount: /exports/north)

silver
  StorageContainer Name: silver
  StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9002
  Max Lumo Size (MB): 1048576
  VP URL: $LUMO_ARRAY_URL
  Arrays:
    array-north
      ArrayId: array-north
      Name: North
      VendorId: Tarsel
      ModelId: T-400
      PEInfo:
        PE #0 (localUID: pe-north-scsi-1, isAccessible: 1, isConfigured: 1, type: SCSI, lunID: naa.6001405a0000000000000000000000a1)
        PE #1 (localUID: pe-north-scsi-2, isAccessible: 0, isConfigured: 1, type: SCSI, lunID: naa.6001405a0000000000000000000000a2)
        PE #2 (localUID: pe-north-nfs-1, isAccessible: 1, isConfigured: 1, type: NFS, ipAddress: 192.0.2.10, serverMount: /exports/north)
    array-south
      ArrayId: array-south
      Name: South
      VendorId: Tarsel
      ModelId: T-900
      PEInfo:
        PE #0 (localUID: pe-south-nfs4x-1, isAccessible: 1, isConfigured: 1, type: NFS4x, ipAddress(es): 198.51.100.21,198.51.100.22, serverMount: /exports/south)
        PE #1 (localUID: pe-south-nfs-1, isAccessible: 0, isConfigured: 0, type: NFS, ipAddress: 198.51.100.30, serverMount: /exports/south-old)
        PE #2 (localUID: pe-south-scsi-1, isAccessible: 1, isConfigured: 0, type: SCSI, lunID: naa.6001405b0000000000000000000000b1)

archive
  StorageContainer Name: archive
  StorageContainer Id: 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9003
  Max Lumo Size (MB): 2048
  VP URL: $LUMO_ARRAY_URL
  Arrays:
    array-south
      ArrayId: array-south
      Name: South
      VendorId: Tarsel
      ModelId: T-900
      PEInfo:
        PE #0 (localUID: pe-south-nfs4x-1, isAccessible: 1, isConfigured: 1, type: NFS4x, ipAddress(es): 198.51.100.21,198.51.100.22, serverMount: /exports/south)
        PE #1 (localUID: pe-south-nfs-1, isAccessible: 0, isConfigured: 0, type: NFS, ipAddress: 198.51.100.30, serverMount: /exports/south-old)
        PE #2 (localUID: pe-south-scsi-1, isAccessible: 1, isConfigured: 0, type: SCSI, lunID: naa.6001405b0000000000000000000000b1)
EOF_OUT
    for name in gold silver archive; do
        [ -d "$TOVI_ROOT/volumes/$name" ]
    done
}

@test "a second load finds them mounted and prints none" {
    load_containers
    lumo storagecontainer load
    expect_done ""
}

@test "in JSON a second load is an empty list" {
    load_containers
    json_of storagecontainer load
    expect_status 0
    expect_json 'd == []'
}

@test "in JSON every field is there, numbers are numbers, order is kept" {
    json_of storagecontainer load
    expect_status 0
    expect_err ""
    expect_json '[list(c) for c in d] == [["StorageContainer Name", "StorageContainer Id", "Max Lumo Size (MB)", "VP URL", "Arrays"]] * 3'
    expect_json '[(c["StorageContainer Name"], c["Max Lumo Size (MB)"]) for c in d] == [("gold", 4194304), ("silver", 1048576), ("archive", 2048)]'
    expect_json '[[a["ArrayId"] for a in c["Arrays"]] for c in d] == [["array-north"], ["array-north", "array-south"], ["array-south"]]'
    expect_json 'list(d[0]["Arrays"][0]) == ["ArrayId", "Name", "VendorId", "ModelId", "PEInfo"] and len(d[0]["Arrays"][0]["PEInfo"]) == 3'
}

@test "a container with the name of one that is mounted is skipped" {
    load_containers
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE container SET id = '0' || substr(id, 2) WHERE name = 'silver'"
    lumo storagecontainer load
    expect_done ""
}

@test "two exported containers of one name: the second is refused" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE container SET name = 'gold' WHERE name = 'silver'"
    lumo storagecontainer load
    expect_failure 1 "Error getting/adding lumo file system '" "gold" ", skipping"
}

@test "what an array does not tell ends its endpoint's line" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE endpoint SET text1 = NULL WHERE uid = 'pe-north-scsi-1';
        UPDATE endpoint SET type = 7 WHERE uid = 'pe-north-scsi-2'; DELETE FROM endpoint_address"
    json_of storagecontainer load
    expect_status 0
    expect_json 'd[0]["Arrays"][0]["PEInfo"][:2] == [
        "PE #0 (localUID: pe-north-scsi-1, isAccessible: 1, isConfigured: 1, type: SCSI, lunID: ",
        "PE #1 (localUID: pe-north-scsi-2, isAccessible: 0, isConfigured: 1"]'
    expect_json 'd[2]["Arrays"][0]["PEInfo"][0].endswith(", ipAddress(es): , serverMount: /exports/south)")'
}

@test "no provider, nothing to load" {
    lumo orkaprovider remove -v lab
    lumo storagecontainer load
    expect_done ""
}

@test "a container that the host refuses ends the load there; what was mounted before stays" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE container SET name = '../silver' WHERE name = 'silver'"
    lumo storagecontainer load
    expect_failure 1 "Error getting/adding lumo file system '" ", skipping"
    [ -d "$TOVI_ROOT/volumes/gold" ]
    [ ! -e "$TOVI_ROOT/silver" ]
    [ ! -e "$TOVI_ROOT/volumes/archive" ]
}

@test "fault_64 names and ids that a terminal would obey are shown, not sent" {
    sqlite3 "$LUMO_ARRAY_FILE" "UPDATE storage_array SET name = 'a' || char(27) || '[31m' || char(13) || char(0x202e)"
    lumo storagecontainer load
    expect_status 0
    expect_out_has 'Name: a\x1b[31m\r\u202e'
    LC_ALL=C run ! grep -q $'\e' "$out"
}

@test "fault_63 output that cannot be written is status 4, and what was done is done" {
    status=0
    tovicli storage internal lumo storagecontainer load >/dev/full 2>"$err" || status=$?
    : >"$out"
    expect_status 4
    [ -s "$err" ]
    [ -d "$TOVI_ROOT/volumes/gold" ]
}

@test "without a daemon it fails at once with its cause" {
    host_down
    lumo storagecontainer load
    expect_failure 3 "Unable to load Lumo datastores: " "$TOVI_ROOT/run/lumod.sock"
}

@test "parameters are refused" {
    lumo storagecontainer load --all
    expect_failure 2 "--all"
}
