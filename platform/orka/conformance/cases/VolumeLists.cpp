// SPDX-License-Identifier: Apache-2.0
//
// A container's config volumes: order, and how many are told.
#include <algorithm>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

/// Lists shorter than this suffice, so that a container of very many volumes costs no more.
constexpr int64_t few = 4;

std::vector<ConfigVolume> madeInOrder(Probe &probe) {
    std::vector<ConfigVolume> made;
    auto spec = probe.freshSpec();
    auto const beginning = spec.directoryName;
    for (int64_t count = 0; count < few; ++count) {
        // Names that fall as their age rises, so that no order by name looks like the order of making.
        spec.directoryName = beginning + '-' + std::to_string(few - count);
        auto const volume = probe.make(spec);
        made.push_back({volume.uuid, volume.directoryName, volume.boundTo});
    }
    return made;
}

std::vector<ConfigVolume> lastOf(std::vector<ConfigVolume> const &volumes, size_t count) {
    expectTrue("at least " + std::to_string(count) + " volumes", volumes.size() >= count, show(volumes));
    return {volumes.end() - static_cast<std::ptrdiff_t>(count), volumes.end()};
}

void inOrderOfMaking(Probe &probe) {
    auto const made = madeInOrder(probe);
    expectEqual("the newest at the list's end, in the order of their making", made,
                lastOf(probe.list(probe.containerId()), made.size()));
}

void orderKeptAfterDeletion(Probe &probe) {
    auto made = madeInOrder(probe);
    VirtualVolume second;
    second.containerId = probe.containerId();
    second.uuid = made[1].uuid;
    probe.remove(second);
    made.erase(made.begin() + 1);
    auto const newest = probe.make();
    made.push_back({newest.uuid, newest.directoryName, newest.boundTo});
    expectEqual("the newest at the list's end, in the order of their making", made,
                lastOf(probe.list(probe.containerId()), made.size()));
}

void bindingKeepsOrder(Probe &probe) {
    auto made = madeInOrder(probe);
    VirtualVolume first;
    first.containerId = probe.containerId();
    first.uuid = made[0].uuid;
    probe.bind(first, probe.ground().endpoint());
    made[0].boundTo = probe.ground().endpoint();
    expectEqual("the newest at the list's end, in the order of their making", made,
                lastOf(probe.list(probe.containerId()), made.size()));
}

/// The list with a bound is the beginning of the list without.
void bounded(Probe &probe, std::function<int64_t(int64_t)> const &maxOf) {
    madeInOrder(probe);
    auto expected = probe.list(probe.containerId());
    auto const max = maxOf(static_cast<int64_t>(expected.size()));
    if (max < static_cast<int64_t>(expected.size())) {
        expected.resize(static_cast<size_t>(std::max<int64_t>(max, 0)));
    }
    expectEqual("the first " + std::to_string(max) + " config volumes", expected, probe.list(probe.containerId(), max));
}

void everyLength(Probe &probe) {
    madeInOrder(probe);
    auto const all = probe.list(probe.containerId());
    for (int64_t max = 0; max <= std::min<int64_t>(few + 1, static_cast<int64_t>(all.size())); ++max) {
        auto const expected = std::vector<ConfigVolume>(all.begin(), all.begin() + max);
        expectEqual("the first " + std::to_string(max) + " config volumes", expected,
                    probe.list(probe.containerId(), max));
    }
}

void aNegativeBound(Probe &probe) {
    probe.make();
    auto const outcome = probe.ask(probe.provider().queryVirtualVolumesOfContainer(
        probe.context(), probe.containerId(), std::numeric_limits<int64_t>::min()));
    bool const isEmpty = outcome.ok() && outcome.value().empty();
    bool const isRefused = !outcome.ok() && outcome.failure().code() == Wire::ErrorCode::InvalidArgument;
    expectTrue("no volume, or an invalid argument", isEmpty || isRefused, show(outcome));
}

void configVolumesOnly(Probe &probe) {
    VolumeSpec spec;
    spec.containerId = probe.containerId();
    spec.kind = VolumeKind::Data;
    auto const data = probe.make(spec);
    for (auto const &volume : probe.list(probe.containerId())) {
        expectTrue("config volumes only", volume.uuid != data.uuid, "a data volume " + show(volume));
        expectTrue("a directory name", !volume.directoryName.empty(), show(volume));
    }
}

void ownContainerOnly(Probe &probe) {
    auto const made = probe.make();
    for (auto const &volume : probe.list(probe.ground().otherContainer().id)) {
        expectTrue("volumes of the container that was asked for", volume.uuid != made.uuid,
                   "another's " + show(volume));
    }
}

void longList(Probe &probe) {
    constexpr size_t count = 60;
    std::vector<std::string> made;
    for (size_t index = 0; index < count; ++index) {
        made.push_back(probe.make().uuid);
    }
    std::vector<std::string> listed;
    for (auto const &volume : lastOf(probe.list(probe.containerId()), count)) {
        listed.push_back(volume.uuid);
    }
    expectEqual("all of them, in order, none twice", made, listed);
}

} // namespace

Cases volumeListCases() {
    return {
        {"volume/list/order", "A container's volumes come in the order of their making.", inOrderOfMaking},
        {"volume/list/order-after-deletion", "Deleting and making keep the others' order, the new one comes last.",
         orderKeptAfterDeletion},
        {"volume/list/order-after-binding", "Binding a volume leaves it at its place.", bindingKeepsOrder},
        {"volume/list/max-zero", "At most 0 volumes are none.",
         [](Probe &probe) { bounded(probe, [](int64_t) -> int64_t { return 0; }); }},
        {"volume/list/max-one", "At most 1 volume is the oldest.",
         [](Probe &probe) { bounded(probe, [](int64_t) -> int64_t { return 1; }); }},
        {"volume/list/max-all-but-one", "At most all but one leaves the newest out.",
         [](Probe &probe) { bounded(probe, [](int64_t count) { return count - 1; }); }},
        {"volume/list/max-exact", "At most as many as there are is all.",
         [](Probe &probe) { bounded(probe, [](int64_t count) { return count; }); }},
        {"volume/list/max-more", "At most more than there are is all.",
         [](Probe &probe) { bounded(probe, [](int64_t count) { return count + 1; }); }},
        {"volume/list/max-beyond-32-bits", "A bound beyond 32 bits is no smaller one.",
         [](Probe &probe) { bounded(probe, [](int64_t) { return (int64_t{1} << 32) + 1; }); }},
        {"volume/list/max-every", "Each bound gives the list's beginning.", everyLength},
        {"volume/list/max-negative", "A negative bound gives nothing, or is an invalid argument.", aNegativeBound},
        {"volume/list/config-only", "Data volumes are not in the list.", configVolumesOnly},
        {"volume/list/own-container-only", "Volumes of other containers are not in the list.", ownContainerOnly},
        {"volume/list/long", "Sixty new volumes are listed whole and in order.", longList},
    };
}

} // namespace Orka::Conformance
