# SPDX-License-Identifier: Apache-2.0
#
# What a client and lumod say to each other: one Request, one or more Replies, in Cap'n Proto's stream framing over a
# Unix stream socket. A method of the C client library keeps its name here (LumoLib_GetStorageContainer is
# getStorageContainer) and in the daemon's handler, so that one grep shows the whole journey.
#
# Rules: a request is one message of at most 1 MiB; a long list in it is sent as several requests. A reply message is at
# most 16 MiB; a long list comes as several replies with the same id, of which only the final one has `last` set. Add
# fields and union members at the end; never reuse a number. `version` changes only when an old peer could misread.

@0xd1f0b7a3c84e5d29;

using Cxx = import "/capnp/c++.capnp";
$Cxx.namespace("Wire");

const protocolVersion :UInt16 = 1;

struct Request {
  version @0 :UInt16;
  id @1 :UInt64;             # the reply carries it
  deadlineMs @2 :UInt32;     # how long the client is going to wait, in milliseconds from now
  traceId @3 :Text;          # names the command in log and error texts
  union {
    ping @4 :Void;
    getStorageContainer @5 :Void;
    findStorageContainer @6 :FindStorageContainer;
    queryAllConfigLumos @7 :QueryAllConfigLumos;
    activateProvider @8 :ActivateProvider;
    deactivateProvider @9 :DeactivateProvider;
    vendorProviderInjectFault @10 :VendorProviderInjectFault;
    setFaultInjectionEnabled @11 :Bool;
    addFaultInjectionRule @12 :FaultInjectionRule;
    modifyFaultInjectionRule @13 :FaultInjectionRule;
    debugCommand @14 :DebugCommand;
    setSpaceEfficiencyManipulationEnabled @15 :Bool;
    spaceStatsForLumo @16 :VolumeKey;
    getLumoInfo @17 :VolumeKey;
    unsharedChunksLumo @18 :VolumeKey;
    getLumoMetadata @19 :VolumeKey;
    # These four answer with the volume as it is, or was, when they are done.
    createVirtualVolume @20 :CreateVirtualVolume;
    bindVirtualVolume @21 :VolumeKey;      # through an accessible endpoint; bound already is success
    unbindVirtualVolume @22 :VolumeKey;    # leaves the binding to the unbind timer
    deleteVirtualVolume @23 :VolumeKey;    # unbinds first
    checkLumoAccessibility @24 :CheckLumoAccessibility;
    protocolEndpointEvent @25 :ProtocolEndpointEvent;
  }
}

struct FindStorageContainer {
  containerId @0 :Text;      # canonical
  arrayIds @1 :List(Text);   # every one must hold the container
}

struct QueryAllConfigLumos {
  containerId @0 :Text;      # canonical
  max @1 :Int32;
}

struct ActivateProvider {
  arrayId @0 :Text;
  providerName @1 :Text;
  activeProviderUrl @2 :Text;  # empty: whichever is active; otherwise the one that must be active now
}

struct DeactivateProvider {
  arrayId @0 :Text;
  providerName @1 :Text;
}

struct VendorProviderInjectFault {
  providerName @0 :Text;
  providerUrl @1 :Text;
  status @2 :Text;           # online, offline, syncError, unknown; default takes an injection back
  arrays @3 :List(ArrayFault);

  struct ArrayFault {
    arrayId @0 :Text;
    isActive @1 :Bool;
  }
}

struct FaultInjectionRule {
  fault @0 :Text;
  operation @1 :Text;        # "*": every operation for which the fault is legal
  frequency @2 :Int32;       # every n-th operation; 0 or less: not given
  timeMs @3 :Int32;          # when this long has passed since the last injection; 0 or less: not given
}

struct DebugCommand {
  # A negative number leaves its setting as it is.
  logLevel @0 :Int64 = -1;
  dump @1 :Int64 = -1;
  unbindPeriodUs @2 :Int64 = -1;   # microseconds; 0 unbinds now
}

struct VolumeKey {
  containerId @0 :Text;      # canonical
  uuid @1 :Text;             # empty: the directory name counts
  directoryName @2 :Text;
}

struct CreateVirtualVolume {
  containerId @0 :Text;      # canonical
  directoryName @1 :Text;
  policy @2 :Text;
  sizeMb @3 :Int64;          # 0: the daemon's default
  vmUuid @4 :Text;
}

struct CheckLumoAccessibility {
  containerId @0 :Text;      # canonical
  lumoIds @1 :List(Text);    # at most 10000 a request
}

struct ProtocolEndpointEvent {
  endpoint @0 :Text;         # its uid
  apd @1 :Bool;              # true: all paths down begins; false: it ends
}

struct Reply {
  # Requests are numbered from 1. A failure with id 0 answers no request in particular: it says why the daemon is about
  # to close the connection (a caller it does not admit, a request that it could not read).
  id @0 :UInt64;
  last @1 :Bool = true;
  union {
    failure @2 :FailureReply;
    done @3 :Void;
    pong @4 :Pong;
    storageArrays @5 :List(StorageArray);          # appended to the reply's table of arrays
    storageContainers @6 :List(StorageContainer);
    configLumos @7 :List(ConfigLumo);
    volume @8 :Volume;
    accessibility @9 :Data;                        # one byte for each id asked about
    containerNames @10 :List(Text);
    spaceStats @11 :SpaceStats;
    lumoInfo @12 :LumoInfo;
    unsharedChunks @13 :UnsharedChunks;
    metadata @14 :List(MetadataPair);
  }
}

struct FailureReply {
  # What becomes a Wire::Failure on the other side.
  code @0 :Int32;
  sentence @1 :Text;         # a finished sentence for the user, with the particulars
}

struct Pong {
  version @0 :Text;
  pid @1 :UInt32;
  uptimeMs @2 :UInt64;
  root @3 :Text;
}

struct StorageArray {
  id @0 :Text;
  name @1 :Text;
  vendorId @2 :Text;
  modelId @3 :Text;
  endpoints @4 :List(Endpoint);
}

struct Endpoint {
  # A text that the array does not tell is left null.
  uid @0 :Text;
  type @1 :Int32;            # 0 SCSI, 1 NFS, 2 NFS4x
  text1 @2 :Text;            # SCSI: lunID; NFS: ipAddress; NFS4x: serverMount
  text2 @3 :Text;            # NFS: serverMount
  addresses @4 :List(Text);  # NFS4x
  isAccessible @5 :Bool;
  isConfigured @6 :Bool;
}

struct StorageContainer {
  id @0 :Text;
  name @1 :Text;
  providerUrl @2 :Text;
  maxLumoSizeMb @3 :Int64;
  arrays @4 :List(UInt32);   # places in the table that this reply's storageArrays built, counted from 0
}

struct ConfigLumo {
  uuid @0 :Text;
  directoryName @1 :Text;
}

struct Volume {
  uuid @0 :Text;
  directoryName @1 :Text;
  endpoint @2 :Text;         # uid of the endpoint it is bound through; empty when unbound
}

struct SpaceStats {
  logicalSizeMb @0 :Int64;
  committedSizeMb @1 :Int64;
  unsharedSizeMb @2 :Int64;
  unsharedSizeValid @3 :Bool;
}

struct LumoInfo {
  storageProfile @0 :Text;   # null: the volume has none
}

struct UnsharedChunks {
  blockSize @0 :Int64;       # bytes
  bitmap @1 :Data;
}

struct MetadataPair {
  key @0 :Text;
  value @1 :Text;
}
