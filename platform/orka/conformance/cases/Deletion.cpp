// SPDX-License-Identifier: Apache-2.0
//
// Deleting volumes.
#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

void isGone(Probe &probe) {
    auto const made = probe.make();
    probe.remove(made);
    expectFailure("the facts of a deleted volume", Wire::ErrorCode::NoSuchVolume,
                  probe.ask(probe.provider().queryVirtualVolume(probe.context(), made.containerId, made.uuid)));
    expectEqual("how many of its name are in the list", int64_t{0}, probe.countNamed(made.directoryName));
    expectEqual("whether its id is known", false, probe.exists(made));
    expectEqual("the volume of its name", std::optional<VirtualVolume>(),
                probe.byName(made.containerId, made.directoryName));
}

void isGoneForOthers(Probe &probe) {
    auto const made = probe.make();
    auto const other = probe.connect();
    expectSuccess("its facts before",
                  probe.ask(other->queryVirtualVolume(probe.context(), made.containerId, made.uuid)));
    probe.remove(made);
    expectFailure("the facts of a deleted volume through another connection", Wire::ErrorCode::NoSuchVolume,
                  probe.ask(other->queryVirtualVolume(probe.context(), made.containerId, made.uuid)));
}

void boundIsRefused(Probe &probe) {
    auto const made = probe.make();
    probe.bind(made, probe.ground().endpoint());
    auto const before = probe.facts(made);
    expectFailure("deleting a volume that is bound", Wire::ErrorCode::InUse, probe.tryRemove(made));
    expectEqual("the volume after the refusal", before, probe.facts(made));
}

void afterUnbinding(Probe &probe) {
    auto const made = probe.make();
    probe.bind(made, probe.ground().endpoint());
    probe.unbind(made);
    probe.remove(made);
    expectEqual("whether its id is known", false, probe.exists(made));
}

void takesMetadataAlong(Probe &probe) {
    auto const made = probe.make();
    probe.remove(made);
    expectFailure("the metadata of a deleted volume", Wire::ErrorCode::NoSuchVolume,
                  probe.ask(probe.provider().getMetadata(probe.context(), made.containerId, made.uuid)));
}

void wrongContainer(Probe &probe) {
    auto const made = probe.make();
    auto elsewhere = made;
    elsewhere.containerId = probe.ground().otherContainer().id;
    expectFailure("deleting a volume of another container", Wire::ErrorCode::NoSuchVolume, probe.tryRemove(elsewhere));
    expectEqual("whether it is still there", true, probe.exists(made));
}

void leavesOthers(Probe &probe) {
    auto const kept = probe.make();
    auto const gone = probe.make();
    auto before = probe.list(probe.containerId());
    probe.remove(gone);
    before.pop_back();
    expectEqual("the others", before, probe.list(probe.containerId()));
    expectEqual("the other volume", kept, probe.facts(kept));
}

} // namespace

Cases deletionCases() {
    return {
        {"volume/delete/gone", "A deleted volume is in no answer any more.", isGone},
        {"volume/delete/gone-for-others", "A deleted volume is gone for every other connection at once.",
         isGoneForOthers},
        {"volume/delete/twice", "Deleting a volume again, without a key, names a volume that there is not.",
         [](Probe &probe) {
             auto const made = probe.make();
             probe.remove(made);
             expectFailure("deleting it again", Wire::ErrorCode::NoSuchVolume, probe.tryRemove(made));
         }},
        {"volume/delete/bound", "A volume that is bound is not deleted, and stays as it was.", boundIsRefused},
        {"volume/delete/unbound-again", "A volume that is unbound again can be deleted.", afterUnbinding},
        {"volume/delete/metadata", "A deleted volume's metadata cannot be asked for.", takesMetadataAlong},
        {"volume/delete/wrong-container", "A volume is not deleted through a container that it is not in.",
         wrongContainer},
        {"volume/delete/leaves-others", "Deleting one volume leaves every other as it was.", leavesOthers},
    };
}

} // namespace Orka::Conformance
