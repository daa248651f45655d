// SPDX-License-Identifier: Apache-2.0
//
// Making volumes: what is asked for is what is there.
#include <algorithm>
#include <set>

#include "conformance/Cases.h"
#include "conformance/Probe.h"
#include "wire/ContainerId.h"

namespace Orka::Conformance {

namespace {

VolumeSpec dataSpec(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    return spec;
}

VolumeSpec sized(Probe &probe, int64_t sizeMb) {
    auto spec = probe.freshSpec();
    spec.sizeMb = sizeMb;
    return spec;
}

/// A specification that is refused, and of which nothing is there afterwards.
void isRefused(Probe &probe, VolumeSpec const &spec, Wire::ErrorCode code, std::string const &what) {
    auto const before = probe.list(probe.containerId());
    expectFailure(what, code, probe.tryMake(spec));
    expectEqual("the container's volumes after a refusal", before, probe.list(probe.containerId()));
}

void keepsFacts(Probe &probe) {
    auto spec = sized(probe, 1);
    spec.profile = "gold;tier=1";
    spec.vmUuid = "vm-42";
    auto const made = probe.make(spec);
    expectEqual("the container", spec.containerId, made.containerId);
    expectEqual("the kind", VolumeKind::Config, made.kind);
    expectEqual("the directory name", spec.directoryName, made.directoryName);
    expectEqual("the size", spec.sizeMb, made.sizeMb);
    expectEqual("the profile", spec.profile, made.profile);
    expectEqual("the virtual machine", spec.vmUuid, made.vmUuid);
    expectEqual("what it is bound through", std::optional<std::string>(), made.boundTo);
}

void answersAsStored(Probe &probe) {
    auto const made = probe.make();
    expectEqual("the volume as it is asked for afterwards", made, probe.facts(made));
}

void isThereForOthers(Probe &probe) {
    auto const made = probe.make();
    probe.reconnect();
    expectEqual("the volume through another connection", made, probe.facts(made));
}

void idsAreUnique(Probe &probe) {
    std::set<std::string> seen;
    for (int round = 0; round < 8; ++round) {
        auto const uuid = probe.make().uuid;
        expectTrue("an id that no other volume has", seen.insert(uuid).second, show(uuid) + " again");
    }
}

void defaultSize(Probe &probe) {
    auto const expected = std::min<int64_t>(4096, probe.ground().container().maxLumoSizeMb);
    expectEqual("the size in MB", expected, probe.make(sized(probe, 0)).sizeMb);
}

void maximumSize(Probe &probe) {
    auto const most = probe.ground().container().maxLumoSizeMb;
    expectEqual("the size in MB", most, probe.make(sized(probe, most)).sizeMb);
}

void aboveMaximum(Probe &probe) {
    auto const most = probe.ground().container().maxLumoSizeMb;
    if (most == everyVolume) {
        throw Inapplicable{"no size is above the container's maximum"};
    }
    isRefused(probe, sized(probe, most + 1), Wire::ErrorCode::TooLarge, "a size of one MB more than the maximum");
}

void nameTaken(Probe &probe) {
    auto const made = probe.make();
    auto spec = probe.freshSpec();
    spec.directoryName = made.directoryName;
    isRefused(probe, spec, Wire::ErrorCode::AlreadyExists, "a directory name that is taken");
    expectEqual("the volume that had the name first", made, probe.facts(made));
}

void nameElsewhere(Probe &probe) {
    auto const made = probe.make();
    auto spec = probe.freshSpec();
    spec.containerId = probe.ground().otherContainer().id;
    spec.directoryName = made.directoryName;
    auto const other = probe.make(spec);
    expectTrue("two volumes with ids of their own", made.uuid != other.uuid, show(other));
}

void nameFreeAgain(Probe &probe) {
    auto const first = probe.make();
    probe.remove(first);
    auto spec = probe.freshSpec();
    spec.directoryName = first.directoryName;
    auto const second = probe.make(spec);
    expectTrue("a new id for a new volume", first.uuid != second.uuid, show(second));
}

void nameOfOtherCase(Probe &probe) {
    auto spec = probe.freshSpec();
    spec.directoryName += "-a";
    probe.make(spec);
    spec.directoryName.back() = 'A';
    expectEqual("the directory name", spec.directoryName, probe.make(spec).directoryName);
}

void keepsProfile(Probe &probe, std::optional<std::string> const &profile) {
    auto spec = probe.freshSpec();
    spec.profile = profile;
    auto const made = probe.make(spec);
    expectEqual("the profile in the answer", profile, made.profile);
    expectEqual("the profile that is stored", profile, probe.facts(made).profile);
}

void dataVolume(Probe &probe) {
    auto const made = probe.make(dataSpec(probe));
    expectEqual("the kind", VolumeKind::Data, made.kind);
    expectEqual("the directory name", std::string(), made.directoryName);
    expectEqual("the volume as it is asked for afterwards", made, probe.facts(made));
}

void dataVolumesWithoutName(Probe &probe) {
    auto const first = probe.make(dataSpec(probe));
    auto const second = probe.make(dataSpec(probe));
    expectTrue("two volumes with ids of their own", first.uuid != second.uuid, show(second));
}

void dataVolumeWithName(Probe &probe) {
    auto spec = dataSpec(probe);
    spec.directoryName = probe.freshName();
    isRefused(probe, spec, Wire::ErrorCode::InvalidArgument, "a data volume with a directory name");
}

void unknownKind(Probe &probe) {
    auto spec = probe.freshSpec();
    spec.kind = static_cast<VolumeKind>(7);
    isRefused(probe, spec, Wire::ErrorCode::InvalidArgument, "a volume of a kind that there is not");
}

void startsEmpty(Probe &probe) {
    auto const made = probe.make();
    expectEqual("what is committed, in MB", int64_t{0}, made.committedMb);
    expectTrue("nothing unshared, or nothing told", made.unsharedMb.value_or(0) == 0, show(made));
}

void blockSize(Probe &probe) {
    auto const size = probe.make().blockSize;
    expectTrue("a block size that is a power of two from 512 bytes on", size >= 512 && (size & (size - 1)) == 0,
               show(size));
}

} // namespace

Cases creationCases() {
    return {
        {"volume/create/facts", "A new volume has the container, kind, name, size, profile and machine asked for.",
         keepsFacts},
        {"volume/create/answer-as-stored", "The answer to the making of a volume is the volume.", answersAsStored},
        {"volume/create/seen-by-others", "A new volume is there for every other connection at once.", isThereForOthers},
        {"volume/create/uuid-canonical", "A new volume's id is a UUID of 36 characters in lower case.",
         [](Probe &probe) {
             auto const made = probe.make();
             expectTrue("a canonical id", Wire::normalizeContainerId(made.uuid) == made.uuid, show(made.uuid));
         }},
        {"volume/create/uuid-unique", "Every new volume has an id of its own.", idsAreUnique},
        {"volume/create/size-default", "Size 0 gives 4096 MB, or the container's maximum when that is smaller.",
         defaultSize},
        {"volume/create/size-one", "A volume of 1 MB can be made.",
         [](Probe &probe) { expectEqual("the size in MB", int64_t{1}, probe.make(sized(probe, 1)).sizeMb); }},
        {"volume/create/size-maximum", "A volume of the container's maximum can be made.", maximumSize},
        {"volume/create/size-above-maximum", "A volume of one MB more than the maximum is refused as too large.",
         aboveMaximum},
        {"volume/create/size-negative", "A negative size is an invalid argument.",
         [](Probe &probe) { isRefused(probe, sized(probe, -1), Wire::ErrorCode::InvalidArgument, "a size of -1 MB"); }},
        {"volume/create/name-taken", "A directory name that the container has already is refused.", nameTaken},
        {"volume/create/name-elsewhere", "Two containers may each have a volume of one name.", nameElsewhere},
        {"volume/create/name-free-again", "The name of a deleted volume is free.", nameFreeAgain},
        {"volume/create/name-case", "Names that differ in case are two names.", nameOfOtherCase},
        {"volume/create/name-missing", "A config volume without a directory name is an invalid argument.",
         [](Probe &probe) {
             auto spec = probe.freshSpec();
             spec.directoryName.clear();
             isRefused(probe, spec, Wire::ErrorCode::InvalidArgument, "a config volume without a name");
         }},
        {"volume/create/profile-none", "A volume made without a profile has none.",
         [](Probe &probe) { keepsProfile(probe, std::nullopt); }},
        {"volume/create/profile-empty", "An empty profile is something else than none.",
         [](Probe &probe) { keepsProfile(probe, ""); }},
        {"volume/create/profile-as-it-is", "A profile is stored byte for byte.",
         [](Probe &probe) { keepsProfile(probe, " a=1;\tb=\"zwei\" <\xc3\xbc>\\n "); }},
        {"volume/create/profile-long", "A profile of 10,000 characters is stored whole.",
         [](Probe &probe) { keepsProfile(probe, std::string(10000, 'p')); }},
        {"volume/create/data", "A data volume has no directory name.", dataVolume},
        {"volume/create/data-without-name", "Several data volumes can be in one container.", dataVolumesWithoutName},
        {"volume/create/data-with-name", "A data volume with a directory name is an invalid argument.",
         dataVolumeWithName},
        {"volume/create/kind-unknown", "A kind that there is not is an invalid argument.", unknownKind},
        {"volume/create/starts-empty", "Nothing is committed of a new volume, and it is bound to nothing.",
         startsEmpty},
        {"volume/create/block-size", "A volume's block size is a power of two from 512 bytes on.", blockSize},
    };
}

} // namespace Orka::Conformance
