// SPDX-License-Identifier: Apache-2.0
//
// The config volume with a directory name, and the volumes that are bound.
#include <algorithm>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

void namesNothing(Probe &probe, std::string const &what, std::string const &name) {
    auto const outcome =
        probe.ask(probe.provider().queryVirtualVolumeByDirectoryName(probe.context(), probe.containerId(), name));
    expectEqual(what, std::optional<VirtualVolume>(), expectSuccess("a volume, or nothing", outcome));
}

void otherCase(Probe &probe) {
    auto spec = probe.freshSpec();
    spec.directoryName += "-name";
    auto const made = probe.make(spec);
    spec.directoryName.back() = 'E';
    namesNothing(probe, "the volume of a name in another case", spec.directoryName);
    expectEqual("the volume of its own name", std::optional<VirtualVolume>(made),
                probe.byName(probe.containerId(), made.directoryName));
}

void partOfAName(Probe &probe) {
    auto const made = probe.make();
    auto const &name = made.directoryName;
    namesNothing(probe, "the volume of a name's beginning", name.substr(0, name.size() - 1));
    namesNothing(probe, "the volume of a longer name", name + ' ');
}

void patterns(Probe &probe) {
    auto const made = probe.make();
    auto const stem = made.directoryName.substr(0, made.directoryName.size() - 1);
    for (auto const *wildcard : {"%", "_", "*", "?", ".*"}) {
        namesNothing(probe, "the volume of a name that looks like a pattern", stem + wildcard);
    }
}

void rightOneOfMany(Probe &probe) {
    std::vector<VirtualVolume> made;
    for (int count = 0; count < 5; ++count) {
        made.push_back(probe.make());
    }
    for (auto const &volume : made) {
        expectEqual("the volume of its name", std::optional<VirtualVolume>(volume),
                    probe.byName(probe.containerId(), volume.directoryName));
    }
}

void inItsContainerOnly(Probe &probe) {
    auto const made = probe.make();
    auto const &other = probe.ground().otherContainer().id;
    expectEqual("the volume of its name in another container", std::optional<VirtualVolume>(),
                probe.byName(other, made.directoryName));
}

std::optional<VirtualVolume> among(std::vector<VirtualVolume> const &volumes, std::string const &uuid) {
    auto const found =
        std::find_if(volumes.begin(), volumes.end(), [&](VirtualVolume const &volume) { return volume.uuid == uuid; });
    return found == volumes.end() ? std::nullopt : std::optional<VirtualVolume>(*found);
}

void boundIsListed(Probe &probe) {
    auto const made = probe.make();
    expectEqual("it among those that are bound, before", std::optional<VirtualVolume>(),
                among(probe.bound(), made.uuid));
    probe.bind(made, probe.ground().endpoint());
    expectEqual("it among those that are bound", std::optional<VirtualVolume>(probe.facts(made)),
                among(probe.bound(), made.uuid));
    probe.unbind(made);
    expectEqual("it among those that are bound, after", std::optional<VirtualVolume>(),
                among(probe.bound(), made.uuid));
}

void everyBoundOne(Probe &probe) {
    auto const before = probe.bound().size();
    std::vector<VirtualVolume> made;
    for (int count = 0; count < 5; ++count) {
        made.push_back(probe.make());
        probe.bind(made.back(), probe.ground().endpoint());
    }
    auto const bound = probe.bound();
    expectEqual("how many are bound", uint64_t{before + made.size()}, uint64_t{bound.size()});
    for (auto const &volume : made) {
        expectTrue("each of them", among(bound, volume.uuid).has_value(), show(bound));
    }
}

void nothingUnbound(Probe &probe) {
    probe.make();
    for (auto const &volume : probe.bound()) {
        expectTrue("a uid of an endpoint with each", volume.boundTo && !volume.boundTo->empty(), show(volume));
    }
}

void ofEveryContainer(Probe &probe) {
    auto const first = probe.make();
    auto spec = probe.freshSpec();
    spec.containerId = probe.ground().otherContainer().id;
    auto const second = probe.make(spec);
    probe.bind(first, probe.ground().endpoint());
    auto const outcome = probe.tryBind(second, probe.ground().endpoint());
    auto const bound = probe.bound();
    expectTrue("a volume of the first container", among(bound, first.uuid).has_value(), show(bound));
    // The endpoint may belong to an array that does not hold the other container.
    expectEqual("whether one of the other is there", outcome.ok(), among(bound, second.uuid).has_value());
}

void boundDataVolume(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    auto const made = probe.make(spec);
    probe.bind(made, probe.ground().endpoint());
    expectTrue("the data volume too", among(probe.bound(), made.uuid).has_value(), show(probe.bound()));
}

} // namespace

Cases volumeNameCases() {
    return {
        {"volume/query-by-name/found", "A directory name gives its volume with all its facts.",
         [](Probe &probe) {
             auto const made = probe.make();
             expectEqual("the volume of its name", std::optional<VirtualVolume>(made),
                         probe.byName(probe.containerId(), made.directoryName));
         }},
        {"volume/query-by-name/unknown", "A name that no volume has gives nothing, and is no failure.",
         [](Probe &probe) { namesNothing(probe, "the volume of an unknown name", probe.freshName()); }},
        {"volume/query-by-name/case", "A name in another case is another name.", otherCase},
        {"volume/query-by-name/part", "A part of a name, or more than it, is another name.", partOfAName},
        {"volume/query-by-name/pattern", "A name is no pattern.", patterns},
        {"volume/query-by-name/empty", "The empty name gives nothing, though data volumes have none.",
         [](Probe &probe) {
             VolumeSpec spec;
             spec.containerId = probe.containerId();
             spec.kind = VolumeKind::Data;
             probe.make(spec);
             namesNothing(probe, "the volume of the empty name", "");
         }},
        {"volume/query-by-name/many", "Each of several names gives its own volume.", rightOneOfMany},
        {"volume/query-by-name/own-container-only", "A name is looked for in the container that is asked for.",
         inItsContainerOnly},
    };
}

Cases boundVolumeCases() {
    return {
        {"volume/query-bound/listed", "A volume is in the list of bound ones while it is bound, with all its facts.",
         boundIsListed},
        {"volume/query-bound/every-one", "Every volume that is bound is listed.", everyBoundOne},
        {"volume/query-bound/bound-only", "Every volume that is listed names its endpoint.", nothingUnbound},
        {"volume/query-bound/every-container", "Bound volumes of all containers are listed.", ofEveryContainer},
        {"volume/query-bound/data", "Bound data volumes are listed.", boundDataVolume},
    };
}

} // namespace Orka::Conformance
