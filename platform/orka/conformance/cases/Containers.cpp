// SPDX-License-Identifier: Apache-2.0
//
// The list of storage containers.
#include <algorithm>
#include <set>

#include "conformance/Cases.h"
#include "conformance/Probe.h"
#include "wire/ContainerId.h"

namespace Orka::Conformance {

namespace {

Listing<StorageContainer> containers(Probe &probe, Provider &provider) {
    auto listing = expectSuccess("the storage containers", probe.ask(provider.queryStorageContainer(probe.context())));
    expectTrue("a list", listing.items != nullptr, "none at all");
    return listing;
}

Listing<StorageContainer> containers(Probe &probe) {
    return containers(probe, probe.provider());
}

std::vector<StorageContainer> items(Probe &probe) {
    return *containers(probe).items;
}

void forEach(Probe &probe, std::string const &expected, bool (*holds)(StorageContainer const &)) {
    for (auto const &container : items(probe)) {
        expectTrue(expected, holds(container), show(container));
    }
}

bool arraysAreUnique(StorageContainer const &container) {
    return std::set<std::string>(container.arrayIds.begin(), container.arrayIds.end()).size() ==
           container.arrayIds.size();
}

void idsAreUnique(Probe &probe) {
    std::set<std::string> seen;
    for (auto const &container : items(probe)) {
        expectTrue("a container's id that occurs once", seen.insert(container.id).second,
                   show(container.id) + " occurs again");
    }
}

void arraysAreKnown(Probe &probe) {
    auto const arrays =
        expectSuccess("the storage arrays", probe.ask(probe.provider().queryStorageArray(probe.context())));
    auto const listing = containers(probe);
    if (listing.version != arrays.version) {
        throw Inapplicable{"something changes the array meanwhile"};
    }
    std::set<std::string> known;
    for (auto const &array : *arrays.items) {
        known.insert(array.id);
    }
    for (auto const &container : *listing.items) {
        for (auto const &id : container.arrayIds) {
            expectTrue("array ids of the list of arrays with the same version", known.count(id) == 1,
                       show(id) + " in " + show(container));
        }
    }
}

void versionIsShared(Probe &probe) {
    auto const arrays =
        expectSuccess("the storage arrays", probe.ask(probe.provider().queryStorageArray(probe.context())));
    expectEqual("the version of both lists, asked for at once", arrays.version, containers(probe).version);
}

void sameVersionMeansSameList(Probe &probe) {
    auto const first = containers(probe);
    for (int round = 0; round < 3; ++round) {
        if (round == 1) {
            probe.make();
        }
        auto const again = containers(probe);
        expectTrue(
            "two lists of one version are the same", again.version != first.version || *again.items == *first.items,
            "version " + show(again.version) + " with " + show(*first.items) + " and with " + show(*again.items));
    }
}

void volumesDoNotShow(Probe &probe) {
    auto const first = containers(probe);
    probe.bind(probe.make(), probe.ground().endpoint());
    expectEqual("the containers after a volume was made and bound", *first.items, *containers(probe).items);
}

void connectionsAgree(Probe &probe) {
    auto const other = probe.connect();
    expectEqual("the containers through another connection", *containers(probe).items,
                *containers(probe, *other).items);
}

void everyOneAnswers(Probe &probe) {
    // Very many of them would take very long.
    constexpr size_t most = 50;
    auto const listing = containers(probe);
    for (size_t index = 0; index < std::min(most, listing.items->size()); ++index) {
        probe.list((*listing.items)[index].id, 1);
    }
}

} // namespace

Cases containerCases() {
    return {
        {"container/list/ids-canonical", "Every container's id is a UUID of 36 characters in lower case.",
         [](Probe &probe) {
             forEach(probe, "a canonical id", [](StorageContainer const &container) {
                 return Wire::normalizeContainerId(container.id) == container.id;
             });
         }},
        {"container/list/ids-unique", "No two storage containers have one id.", idsAreUnique},
        {"container/list/names-not-empty", "Every storage container has a name.",
         [](Probe &probe) {
             forEach(probe, "a name that is not empty",
                     [](StorageContainer const &container) { return !container.name.empty(); });
         }},
        {"container/list/maximum-positive", "Every container's largest volume has at least 1 MB.",
         [](Probe &probe) {
             forEach(probe, "a maximum above 0",
                     [](StorageContainer const &container) { return container.maxLumoSizeMb > 0; });
         }},
        {"container/list/arrays-unique", "A container names an array once.",
         [](Probe &probe) { forEach(probe, "array ids that occur once", arraysAreUnique); }},
        {"container/list/arrays-known", "A container names arrays of the list with the same version only.",
         arraysAreKnown},
        {"container/list/order-stable", "The order of containers and of their arrays is the same each time.",
         [](Probe &probe) {
             auto const first = containers(probe);
             expectEqual("the same list again", *first.items, *containers(probe).items);
         }},
        {"container/list/version-stable", "While nothing changes, the list keeps its version.",
         [](Probe &probe) {
             auto const first = containers(probe);
             expectEqual("the version of a list that is asked for again at once", first.version,
                         containers(probe).version);
         }},
        {"container/list/version-shared", "Arrays and containers that are asked for at once have one version.",
         versionIsShared},
        {"container/list/same-version-same-content", "Two lists of one version are the same.",
         sameVersionMeansSameList},
        {"container/list/volumes-do-not-show", "Making and binding a volume changes nothing in the list of containers.",
         volumesDoNotShow},
        {"container/list/connections-agree", "Two connections are told the same containers.", connectionsAgree},
        {"container/list/every-one-answers", "Each container that is exported can be asked for its volumes.",
         everyOneAnswers},
    };
}

} // namespace Orka::Conformance
