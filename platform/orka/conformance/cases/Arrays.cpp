// SPDX-License-Identifier: Apache-2.0
//
// The list of storage arrays.
#include <set>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

Listing<StorageArray> arrays(Probe &probe, Provider &provider) {
    auto listing = expectSuccess("the storage arrays", probe.ask(provider.queryStorageArray(probe.context())));
    expectTrue("a list", listing.items != nullptr, "none at all");
    return listing;
}

Listing<StorageArray> arrays(Probe &probe) {
    return arrays(probe, probe.provider());
}

std::vector<StorageArray> items(Probe &probe) {
    return *arrays(probe).items;
}

void idsAreUnique(Probe &probe) {
    std::set<std::string> seen;
    for (auto const &array : items(probe)) {
        expectTrue("an array's id that occurs once", seen.insert(array.id).second, show(array.id) + " occurs again");
    }
}

void uidsAreUnique(Probe &probe) {
    std::set<std::string> seen;
    for (auto const &array : items(probe)) {
        for (auto const &endpoint : array.endpoints) {
            expectTrue("an endpoint's uid that occurs once among all arrays",
                       !endpoint.uid || seen.insert(*endpoint.uid).second, show(endpoint) + " again");
        }
    }
}

void uidsAreNotEmpty(Probe &probe) {
    for (auto const &array : items(probe)) {
        for (auto const &endpoint : array.endpoints) {
            expectTrue("a uid that is told is not empty", endpoint.uid != "", show(array));
        }
    }
}

void textsFitTransports(Probe &probe) {
    for (auto const &array : items(probe)) {
        for (auto const &endpoint : array.endpoints) {
            bool const isNfs = endpoint.type == static_cast<int32_t>(TransportType::Nfs);
            bool const isNfs4x = endpoint.type == static_cast<int32_t>(TransportType::Nfs4x);
            expectTrue("addresses with NFS4x only", isNfs4x || endpoint.nfs4xAddresses.empty(), show(endpoint));
            expectTrue("a second text with NFS only", isNfs || !endpoint.text2, show(endpoint));
        }
    }
}

void sameVersionMeansSameList(Probe &probe) {
    auto const first = arrays(probe);
    for (int round = 0; round < 3; ++round) {
        if (round == 1) {
            probe.make();
        }
        auto const again = arrays(probe);
        expectTrue(
            "two lists of one version are the same", again.version != first.version || *again.items == *first.items,
            "version " + show(again.version) + " with " + show(*first.items) + " and with " + show(*again.items));
    }
}

void versionStands(Probe &probe) {
    auto const first = arrays(probe);
    expectEqual("the version of a list that is asked for again at once", first.version, arrays(probe).version);
}

void volumesDoNotShow(Probe &probe) {
    auto const first = arrays(probe);
    probe.bind(probe.make(), probe.ground().endpoint());
    expectEqual("the arrays after a volume was made and bound", *first.items, *arrays(probe).items);
}

void connectionsAgree(Probe &probe) {
    auto const other = probe.connect();
    expectEqual("the arrays through another connection", *arrays(probe).items, *arrays(probe, *other).items);
}

void listOutlivesConnection(Probe &probe) {
    auto const first = arrays(probe);
    auto const copy = *first.items;
    probe.reconnect();
    arrays(probe);
    expectEqual("a list that is kept after its connection has gone", copy, *first.items);
}

} // namespace

Cases arrayCases() {
    return {
        {"array/list/ids-not-empty", "Every storage array has an id.",
         [](Probe &probe) {
             for (auto const &array : items(probe)) {
                 expectTrue("an id that is not empty", !array.id.empty(), show(array));
             }
         }},
        {"array/list/ids-unique", "No two storage arrays have one id.", idsAreUnique},
        {"array/list/endpoint-uids-not-empty", "An endpoint's uid that is told is not empty.", uidsAreNotEmpty},
        {"array/list/endpoint-uids-unique", "No two endpoints of a provider have one uid.", uidsAreUnique},
        {"array/list/texts-fit-transport",
         "Addresses are told of NFS4x endpoints only, a second text of NFS endpoints only.", textsFitTransports},
        {"array/list/order-stable", "The order of arrays and endpoints is the same each time.",
         [](Probe &probe) {
             auto const first = arrays(probe);
             expectEqual("the same list again", *first.items, *arrays(probe).items);
         }},
        {"array/list/version-stable", "While nothing changes, the list keeps its version.", versionStands},
        {"array/list/same-version-same-content", "Two lists of one version are the same.", sameVersionMeansSameList},
        {"array/list/volumes-do-not-show", "Making and binding a volume changes nothing in the list of arrays.",
         volumesDoNotShow},
        {"array/list/connections-agree", "Two connections are told the same arrays.", connectionsAgree},
        {"array/list/outlives-connection", "A list stays as it is after the connection that gave it has gone.",
         listOutlivesConnection},
    };
}

} // namespace Orka::Conformance
