// SPDX-License-Identifier: Apache-2.0
//
// Connections and promises that come and go, and an array that is left as it was.
#include "conformance/Cases.h"
#include "conformance/Operations.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

void promisesOutlive(Probe &probe) {
    auto const made = probe.make();
    Subject const subject{made.containerId, made.uuid, probe.ground().endpoint(), made.directoryName};
    for (auto const &operation : operations()) {
        if (std::string_view(operation.name).substr(0, 5) != "query") {
            continue;
        }
        auto connection = probe.connect();
        auto promise = operation.perform(*connection, probe.context(), subject);
        connection.reset();
        auto const outcome = probe.ask(kj::mv(promise));
        // Nothing says that it has to be asked still; something has to come.
        if (!outcome.ok()) {
            expectFailure("an answer after the provider object has gone",
                          {Wire::ErrorCode::ProviderUnreachable, Wire::ErrorCode::DeadlineExceeded}, outcome);
        }
    }
}

void unusedConnections(Probe &probe) {
    for (int count = 0; count < 100; ++count) {
        auto const connection = probe.connect();
    }
    probe.list(probe.containerId(), 1);
}

void manyConnections(Probe &probe) {
    auto const made = probe.make();
    for (int count = 0; count < 50; ++count) {
        probe.reconnect();
        expectEqual("the volume", made, probe.facts(made));
    }
}

void droppedReads(Probe &probe) {
    auto const made = probe.make();
    Subject const subject{made.containerId, made.uuid, probe.ground().endpoint(), made.directoryName};
    for (int round = 0; round < 10; ++round) {
        for (auto const &operation : operations()) {
            if (std::string_view(operation.name).substr(0, 5) == "query") {
                auto const promise = operation.perform(probe.provider(), probe.context(), subject);
                if (probe.choose(2) == 0) {
                    probe.pass(probe.choose(500) * kj::MICROSECONDS);
                }
            }
        }
    }
    expectEqual("the volume through the same connection", made, probe.facts(made));
}

void failuresAreNotCatching(Probe &probe) {
    auto const made = probe.make();
    Subject const nowhere{unknownId, unknownId, "nowhere", probe.freshName()};
    for (auto const &operation : operations()) {
        if (operation.namesContainer) {
            expectFailure("a container that there is not", Wire::ErrorCode::NoSuchContainer,
                          probe.ask(operation.perform(probe.provider(), probe.context(), nowhere)));
            expectEqual("the volume after a failure", made, probe.facts(made));
        }
    }
}

} // namespace

Cases lifetimeCases() {
    return {
        {"lifetime/promise-outlives-provider", "A question is answered although the provider object has gone.",
         promisesOutlive},
        {"lifetime/unused-connections", "Connections that are never used cost nothing.", unusedConnections},
        {"lifetime/many-connections", "One connection after the other is served.", manyConnections},
        {"lifetime/dropped-reads", "A connection whose answers are not waited for goes on serving.", droppedReads},
        {"lifetime/after-failures", "A failure spoils nothing that comes after it.", failuresAreNotCatching},
    };
}

Cases residueCases() {
    return {
        {"residue/arrays", "The storage arrays are as they were before the first case.",
         [](Probe &probe) { expectEqual("the arrays", probe.before().arrays, takeSnapshot(probe).arrays); }},
        {"residue/containers", "The storage containers are as they were before the first case.",
         [](Probe &probe) {
             expectEqual("the containers", probe.before().containers, takeSnapshot(probe).containers);
         }},
        {"residue/volumes", "The config volumes are those that were there before the first case.",
         [](Probe &probe) {
             auto const now = takeSnapshot(probe);
             for (auto const &[container, volumes] : probe.before().configVolumes) {
                 expectEqual("the volumes of " + show(container), volumes, now.configVolumes.at(container));
             }
         }},
        {"residue/bindings", "The volumes that are bound are those that were before the first case.",
         [](Probe &probe) { expectEqual("the bound volumes", probe.before().bound, takeSnapshot(probe).bound); }},
    };
}

} // namespace Orka::Conformance
