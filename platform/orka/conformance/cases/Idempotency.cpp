// SPDX-License-Identifier: Apache-2.0
//
// Keys that make a repetition harmless.
#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

VirtualVolume makeWith(Probe &probe, VolumeSpec const &spec, std::string const &key) {
    return expectSuccess("a volume made with a key", probe.tryMake(spec, key));
}

void createRepeated(Probe &probe) {
    auto const spec = probe.freshSpec();
    auto const key = probe.freshKey();
    auto const first = makeWith(probe, spec, key);
    for (int round = 0; round < 3; ++round) {
        expectEqual("the first answer again", first, makeWith(probe, spec, key));
    }
    expectEqual("how many volumes have the name", int64_t{1}, probe.countNamed(spec.directoryName));
}

void createDataRepeated(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    auto const key = probe.freshKey();
    auto const first = makeWith(probe, spec, key);
    expectEqual("the first answer again", first, makeWith(probe, spec, key));
}

void createAcrossConnections(Probe &probe) {
    auto const spec = probe.freshSpec();
    auto const key = probe.freshKey();
    auto const first = makeWith(probe, spec, key);
    probe.reconnect();
    expectEqual("the first answer through a new connection", first, makeWith(probe, spec, key));
}

void createAnswersAsItWas(Probe &probe) {
    auto const spec = probe.freshSpec();
    auto const key = probe.freshKey();
    auto const first = makeWith(probe, spec, key);
    probe.bind(first, probe.ground().endpoint());
    expectEqual("the first answer although it is bound now", first, makeWith(probe, spec, key));
}

void createAfterDeletion(Probe &probe) {
    auto const spec = probe.freshSpec();
    auto const key = probe.freshKey();
    auto const first = makeWith(probe, spec, key);
    probe.remove(first);
    expectEqual("the first answer although it is gone", first, makeWith(probe, spec, key));
    expectEqual("how many volumes have the name", int64_t{0}, probe.countNamed(spec.directoryName));
}

void deleteRepeated(Probe &probe) {
    auto const made = probe.make();
    auto const key = probe.freshKey();
    expectSuccess("deleting it", probe.tryRemove(made, key));
    expectSuccess("deleting it again with the key", probe.tryRemove(made, key));
    probe.reconnect();
    expectSuccess("deleting it again through a new connection", probe.tryRemove(made, key));
    expectFailure("deleting it with a new key", Wire::ErrorCode::NoSuchVolume, probe.tryRemove(made, probe.freshKey()));
}

void deleteSparesSuccessor(Probe &probe) {
    auto const first = probe.make();
    auto const key = probe.freshKey();
    expectSuccess("deleting it", probe.tryRemove(first, key));
    auto spec = probe.freshSpec();
    spec.directoryName = first.directoryName;
    auto const second = probe.make(spec);
    expectSuccess("deleting the first again with the key", probe.tryRemove(first, key));
    expectEqual("whether the second is there", true, probe.exists(second));
}

void bindOnce(Probe &probe) {
    auto const made = probe.make();
    auto const key = probe.freshKey();
    auto const &endpoint = probe.ground().endpoint();
    expectSuccess("binding it", probe.tryBind(made, endpoint, key));
    probe.unbind(made);
    expectSuccess("binding it again with the key", probe.tryBind(made, endpoint, key));
    expectEqual("what it is bound through", std::optional<std::string>(), probe.facts(made).boundTo);
}

void unbindOnce(Probe &probe) {
    auto const made = probe.make();
    auto const key = probe.freshKey();
    auto const &endpoint = probe.ground().endpoint();
    probe.bind(made, endpoint);
    expectSuccess("unbinding it", probe.tryUnbind(made, key));
    probe.bind(made, endpoint);
    expectSuccess("unbinding it again with the key", probe.tryUnbind(made, key));
    expectEqual("what it is bound through", std::optional<std::string>(endpoint), probe.facts(made).boundTo);
}

void otherSpec(Probe &probe, std::string const &what, void (*change)(VolumeSpec &)) {
    auto spec = probe.freshSpec();
    auto const key = probe.freshKey();
    spec.sizeMb = 1;
    spec.profile = "p";
    auto const first = makeWith(probe, spec, key);
    change(spec);
    expectFailure("the key with " + what, Wire::ErrorCode::InvalidArgument, probe.tryMake(spec, key));
    expectEqual("the volume that was made first", first, probe.facts(first));
    expectEqual("how many volumes have the other name", int64_t{first.directoryName == spec.directoryName ? 1 : 0},
                probe.countNamed(spec.directoryName));
}

void otherVolume(Probe &probe) {
    auto const first = probe.make();
    auto const second = probe.make();
    auto const key = probe.freshKey();
    expectSuccess("deleting one", probe.tryRemove(first, key));
    expectFailure("deleting another with its key", Wire::ErrorCode::InvalidArgument, probe.tryRemove(second, key));
    expectEqual("whether the other is there", true, probe.exists(second));
}

void otherEndpoint(Probe &probe) {
    auto const &second = probe.ground().secondEndpoint();
    auto const made = probe.make();
    auto const key = probe.freshKey();
    expectSuccess("binding it", probe.tryBind(made, probe.ground().endpoint(), key));
    probe.unbind(made);
    expectFailure("binding it to another endpoint with the key", Wire::ErrorCode::InvalidArgument,
                  probe.tryBind(made, second, key));
    expectEqual("what it is bound through", std::optional<std::string>(), probe.facts(made).boundTo);
}

void otherOperation(Probe &probe) {
    auto const key = probe.freshKey();
    auto const made = makeWith(probe, probe.freshSpec(), key);
    expectFailure("deleting with the key of its making", Wire::ErrorCode::InvalidArgument, probe.tryRemove(made, key));
    expectFailure("unbinding with the key of its making", Wire::ErrorCode::InvalidArgument, probe.tryUnbind(made, key));
    expectEqual("the volume", made, probe.facts(made));
}

void failureIsNotKept(Probe &probe) {
    auto const blocker = probe.make();
    auto spec = probe.freshSpec();
    spec.directoryName = blocker.directoryName;
    auto const key = probe.freshKey();
    expectFailure("a name that is taken", Wire::ErrorCode::AlreadyExists, probe.tryMake(spec, key));
    probe.remove(blocker);
    expectEqual("the name, once it is free", spec.directoryName, makeWith(probe, spec, key).directoryName);
}

void failedKeyIsFree(Probe &probe) {
    auto const blocker = probe.make();
    auto spec = probe.freshSpec();
    spec.directoryName = blocker.directoryName;
    auto const key = probe.freshKey();
    expectFailure("a name that is taken", Wire::ErrorCode::AlreadyExists, probe.tryMake(spec, key));
    auto const other = probe.freshSpec();
    expectEqual("another name with the key of what failed", other.directoryName,
                makeWith(probe, other, key).directoryName);
}

void otherKey(Probe &probe) {
    auto const spec = probe.freshSpec();
    makeWith(probe, spec, probe.freshKey());
    expectFailure("the same with another key", Wire::ErrorCode::AlreadyExists, probe.tryMake(spec, probe.freshKey()));
}

void noKey(Probe &probe) {
    auto const spec = probe.freshSpec();
    auto const made = makeWith(probe, spec, "");
    expectFailure("the same without a key", Wire::ErrorCode::AlreadyExists, probe.tryMake(spec));
    auto const &endpoint = probe.ground().endpoint();
    for (int round = 0; round < 2; ++round) {
        expectSuccess("binding it without a key", probe.tryBind(made, endpoint));
        expectEqual("what it is bound through", std::optional<std::string>(endpoint), probe.facts(made).boundTo);
        expectSuccess("unbinding it without a key", probe.tryUnbind(made));
        expectEqual("what it is bound through", std::optional<std::string>(), probe.facts(made).boundTo);
    }
    expectSuccess("deleting it without a key", probe.tryRemove(made));
    makeWith(probe, spec, "");
}

/// Two keys that look alike are two keys.
void tellsApart(Probe &probe, std::string const &first, std::string const &second) {
    auto const base = probe.freshKey();
    auto const spec = probe.freshSpec();
    auto const made = makeWith(probe, spec, base + first);
    auto const other = makeWith(probe, probe.freshSpec(), base + second);
    expectTrue("another volume for another key", other.uuid != made.uuid, show(other));
    expectEqual("the first answer for the first key", made, makeWith(probe, spec, base + first));
}

} // namespace

Cases idempotencyCases() {
    return {
        {"idempotency/create/repeated", "A making that is repeated with its key makes one volume.", createRepeated},
        {"idempotency/create/data", "A data volume whose making is repeated with its key is one volume.",
         createDataRepeated},
        {"idempotency/create/across-connections", "A key is known to every connection.", createAcrossConnections},
        {"idempotency/create/answer-as-it-was", "A repetition gives the first answer, whatever happened since.",
         createAnswersAsItWas},
        {"idempotency/create/after-deletion", "A repetition makes nothing anew of what was deleted since.",
         createAfterDeletion},
        {"idempotency/delete/repeated", "A deletion that is repeated with its key is success.", deleteRepeated},
        {"idempotency/delete/spares-successor", "A repeated deletion leaves a new volume of the same name alone.",
         deleteSparesSuccessor},
        {"idempotency/bind/once", "A repeated binding does not bind again what was unbound since.", bindOnce},
        {"idempotency/unbind/once", "A repeated unbinding does not unbind again what was bound since.", unbindOnce},
        {"idempotency/other/name", "A key that comes back with another name is an invalid argument.",
         [](Probe &probe) { otherSpec(probe, "another name", [](VolumeSpec &spec) { spec.directoryName += "-b"; }); }},
        {"idempotency/other/size", "A key that comes back with another size is an invalid argument.",
         [](Probe &probe) { otherSpec(probe, "another size", [](VolumeSpec &spec) { spec.sizeMb = 0; }); }},
        {"idempotency/other/profile", "A key that comes back without the profile is an invalid argument.",
         [](Probe &probe) { otherSpec(probe, "no profile", [](VolumeSpec &spec) { spec.profile.reset(); }); }},
        {"idempotency/other/machine", "A key that comes back with another machine is an invalid argument.",
         [](Probe &probe) { otherSpec(probe, "another machine", [](VolumeSpec &spec) { spec.vmUuid = "vm-7"; }); }},
        {"idempotency/other/volume", "A key that comes back with another volume is an invalid argument.", otherVolume},
        {"idempotency/other/endpoint", "A key that comes back with another endpoint is an invalid argument.",
         otherEndpoint},
        {"idempotency/other/operation", "A key that comes back with another operation is an invalid argument.",
         otherOperation},
        {"idempotency/failure/tried-anew", "What failed is tried anew with the same key.", failureIsNotKept},
        {"idempotency/failure/key-free", "The key of what failed may come with something else.", failedKeyIsFree},
        {"idempotency/key/another", "Another key is another making.", otherKey},
        {"idempotency/key/none", "Without a key, every mutation is a new one.", noKey},
        {"idempotency/key/case", "Keys that differ in case are two keys.",
         [](Probe &probe) { tellsApart(probe, "-k", "-K"); }},
        {"idempotency/key/long", "Keys that differ at their 1000th character are two keys.",
         [](Probe &probe) {
             std::string const tail(950, 'k');
             tellsApart(probe, tail + "1", tail + "2");
         }},
        {"idempotency/key/blanks", "Keys that differ in blanks are two keys.",
         [](Probe &probe) { tellsApart(probe, "- k", "-  k"); }},
        {"idempotency/key/quotes", "Keys may hold quotes, semicolons, slashes and percent signs.",
         [](Probe &probe) { tellsApart(probe, "-'\";/%2f", "-'\";/%2F"); }},
    };
}

} // namespace Orka::Conformance
