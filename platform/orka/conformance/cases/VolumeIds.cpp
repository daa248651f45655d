// SPDX-License-Identifier: Apache-2.0
//
// What is known of each of many ids.
#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

/// As many as one request for accessibility may name.
constexpr size_t most = 10000;

std::string madeUpId(size_t number) {
    auto const digits = std::to_string(number);
    return std::string("ffffffff-ffff-4fff-bfff-") + std::string(12 - digits.size(), '0') + digits;
}

void inOrder(Probe &probe) {
    auto const bound = probe.make();
    auto const free = probe.make();
    probe.bind(bound, probe.ground().endpoint());
    auto const answers = probe.presence(probe.containerId(), {free.uuid, unknownId, bound.uuid});
    std::vector<VolumePresence> const expected{
        {true, std::nullopt}, {false, std::nullopt}, {true, probe.ground().endpoint()}};
    expectEqual("an answer for each id at its place", expected, answers);
}

void repeated(Probe &probe) {
    auto const made = probe.make();
    auto const answers = probe.presence(probe.containerId(), {made.uuid, unknownId, made.uuid, unknownId, made.uuid});
    std::vector<VolumePresence> const expected{
        {true, std::nullopt}, {false, std::nullopt}, {true, std::nullopt}, {false, std::nullopt}, {true, std::nullopt}};
    expectEqual("an answer for each occurrence", expected, answers);
}

void ofAnotherContainer(Probe &probe) {
    auto const made = probe.make();
    expectEqual("whether another container knows it", false,
                probe.presence(probe.ground().otherContainer().id, {made.uuid})[0].exists);
}

void ofADataVolume(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    expectEqual("whether a data volume is known", true, probe.exists(probe.make(spec)));
}

void malformed(Probe &probe) {
    auto const made = probe.make();
    auto const outcome = probe.ask(probe.provider().queryVirtualVolumesById(
        probe.context(), probe.containerId(), {"", "no uuid", made.uuid + "0", made.uuid}));
    if (!outcome.ok()) {
        expectFailure("ids that are none", Wire::ErrorCode::InvalidArgument, outcome);
        return;
    }
    std::vector<VolumePresence> const expected{
        {false, std::nullopt}, {false, std::nullopt}, {false, std::nullopt}, {true, std::nullopt}};
    expectEqual("ids that are none are unknown", expected, outcome.value());
}

void veryMany(Probe &probe, bool onlyOne) {
    auto const made = probe.make();
    std::vector<std::string> ids;
    for (size_t index = 0; index < most; ++index) {
        ids.push_back(index % 1000 == 999 || onlyOne ? made.uuid : madeUpId(index));
    }
    auto const answers = probe.presence(probe.containerId(), ids);
    for (size_t index = 0; index < most; ++index) {
        expectEqual("whether id number " + std::to_string(index) + " is known", ids[index] == made.uuid,
                    answers[index].exists);
    }
}

} // namespace

Cases volumeIdCases() {
    return {
        {"volume/query-by-id/order", "Each id is answered at its place in the list.", inOrder},
        {"volume/query-by-id/repeated", "An id that occurs again is answered again.", repeated},
        {"volume/query-by-id/none", "No ids give no answers.",
         [](Probe &probe) { probe.presence(probe.containerId(), {}); }},
        {"volume/query-by-id/unknown", "An id that no volume has is unknown, and no failure.",
         [](Probe &probe) {
             expectEqual("an unknown id", VolumePresence{}, probe.presence(probe.containerId(), {unknownId})[0]);
         }},
        {"volume/query-by-id/malformed", "What is no id is unknown, or an invalid argument.", malformed},
        {"volume/query-by-id/other-container", "A volume is unknown in every container but its own.",
         ofAnotherContainer},
        {"volume/query-by-id/data", "A data volume is known by its id.", ofADataVolume},
        {"volume/query-by-id/ten-thousand", "10,000 ids are answered, each at its place.",
         [](Probe &probe) { veryMany(probe, false); }},
        {"volume/query-by-id/ten-thousand-times-one", "One id 10,000 times is answered 10,000 times.",
         [](Probe &probe) { veryMany(probe, true); }},
    };
}

} // namespace Orka::Conformance
