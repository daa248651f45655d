// SPDX-License-Identifier: Apache-2.0
//
// Binding volumes to endpoints, and taking that back.
#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

using Uid = std::optional<std::string>;

void shows(Probe &probe) {
    auto const made = probe.make();
    auto const &endpoint = probe.ground().endpoint();
    probe.bind(made, endpoint);
    auto expected = made;
    expected.boundTo = endpoint;
    expectEqual("the volume's facts", expected, probe.facts(made));
    expectEqual("what is known of its id", Uid(endpoint), probe.presence(made.containerId, {made.uuid})[0].boundTo);
    expectEqual("its entry in the container's list", Uid(endpoint), probe.list(made.containerId).back().boundTo);
    auto const named = probe.byName(made.containerId, made.directoryName);
    expectEqual("the volume of its name", std::optional<VirtualVolume>(expected), named);
}

void seenByOthers(Probe &probe) {
    auto const made = probe.make();
    probe.bind(made, probe.ground().endpoint());
    probe.reconnect();
    expectEqual("what it is bound through", Uid(probe.ground().endpoint()), probe.facts(made).boundTo);
}

/// A binding that is refused changes nothing.
void isRefused(Probe &probe, std::string const &endpoint, Wire::ErrorCode code, std::string const &what) {
    auto const made = probe.make();
    expectFailure(what, code, probe.tryBind(made, endpoint));
    expectEqual("the volume after the refusal", made, probe.facts(made));
}

void otherEndpoint(Probe &probe) {
    auto const made = probe.make();
    auto const &second = probe.ground().secondEndpoint();
    probe.bind(made, probe.ground().endpoint());
    expectFailure("binding it to another endpoint", Wire::ErrorCode::InUse, probe.tryBind(made, second));
    expectEqual("what it is bound through", Uid(probe.ground().endpoint()), probe.facts(made).boundTo);
}

void toAnotherAfterUnbinding(Probe &probe) {
    auto const made = probe.make();
    auto const &second = probe.ground().secondEndpoint();
    probe.bind(made, probe.ground().endpoint());
    probe.unbind(made);
    probe.bind(made, second);
    expectEqual("what it is bound through", Uid(second), probe.facts(made).boundTo);
}

void wrongContainer(Probe &probe, bool binds) {
    auto const made = probe.make();
    auto elsewhere = made;
    elsewhere.containerId = probe.ground().otherContainer().id;
    if (!binds) {
        probe.bind(made, probe.ground().endpoint());
    }
    auto const before = probe.facts(made);
    auto const outcome = binds ? probe.tryBind(elsewhere, probe.ground().endpoint()) : probe.tryUnbind(elsewhere);
    expectFailure("a volume of another container", Wire::ErrorCode::NoSuchVolume, outcome);
    expectEqual("the volume after the refusal", before, probe.facts(made));
}

void dataVolume(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    auto const made = probe.make(spec);
    probe.bind(made, probe.ground().endpoint());
    expectEqual("what it is bound through", Uid(probe.ground().endpoint()), probe.facts(made).boundTo);
}

void severalThroughOne(Probe &probe) {
    auto const first = probe.make();
    auto const second = probe.make();
    probe.bind(first, probe.ground().endpoint());
    probe.bind(second, probe.ground().endpoint());
    probe.unbind(first);
    expectEqual("what the other is bound through", Uid(probe.ground().endpoint()), probe.facts(second).boundTo);
    expectEqual("what the unbound one is bound through", Uid(), probe.facts(first).boundTo);
}

} // namespace

Cases bindingCases() {
    return {
        {"volume/bind/shows", "What a volume is bound through stands in every answer about it.", shows},
        {"volume/bind/seen-by-others", "A binding is there for every other connection at once.", seenByOthers},
        {"volume/bind/again", "Binding a volume to the endpoint that it is bound to is success.",
         [](Probe &probe) {
             auto const made = probe.make();
             probe.bind(made, probe.ground().endpoint());
             probe.bind(made, probe.ground().endpoint());
             expectEqual("what it is bound through", Uid(probe.ground().endpoint()), probe.facts(made).boundTo);
         }},
        {"volume/bind/other-endpoint", "A volume that is bound is not bound to another endpoint.", otherEndpoint},
        {"volume/bind/other-after-unbinding", "A volume that is unbound can be bound to another endpoint.",
         toAnotherAfterUnbinding},
        {"volume/bind/endpoint-unknown", "A uid that no endpoint has is refused.",
         [](Probe &probe) {
             isRefused(probe, "orka-kit-no-such-endpoint", Wire::ErrorCode::NoSuchEndpoint,
                       "an endpoint that there is not");
         }},
        {"volume/bind/endpoint-empty", "An empty uid is no endpoint's.",
         [](Probe &probe) { isRefused(probe, "", Wire::ErrorCode::NoSuchEndpoint, "an empty uid"); }},
        {"volume/bind/endpoint-foreign", "An endpoint of an array that does not hold the container is refused.",
         [](Probe &probe) {
             isRefused(probe, probe.ground().foreignEndpoint(), Wire::ErrorCode::NoSuchEndpoint,
                       "another array's endpoint");
         }},
        {"volume/bind/endpoint-inaccessible", "An endpoint that the array says is not accessible is refused.",
         [](Probe &probe) {
             isRefused(probe, probe.ground().inaccessibleEndpoint(), Wire::ErrorCode::NoAccessibleEndpoint,
                       "an endpoint that is not accessible");
         }},
        {"volume/bind/wrong-container", "A volume is not bound through a container that it is not in.",
         [](Probe &probe) { wrongContainer(probe, true); }},
        {"volume/bind/data", "A data volume can be bound.", dataVolume},
        {"volume/bind/several", "Several volumes are bound through one endpoint, each on its own.", severalThroughOne},
        {"volume/unbind/shows", "A volume that is unbound is as it was before it was bound.",
         [](Probe &probe) {
             auto const made = probe.make();
             probe.bind(made, probe.ground().endpoint());
             probe.unbind(made);
             expectEqual("the volume's facts", made, probe.facts(made));
         }},
        {"volume/unbind/not-bound", "Unbinding a volume that is not bound is success.",
         [](Probe &probe) {
             auto const made = probe.make();
             probe.unbind(made);
             expectEqual("the volume's facts", made, probe.facts(made));
         }},
        {"volume/unbind/wrong-container", "A volume is not unbound through a container that it is not in.",
         [](Probe &probe) { wrongContainer(probe, false); }},
    };
}

} // namespace Orka::Conformance
