// SPDX-License-Identifier: Apache-2.0
//
// Operations on what there is not, and the context in which a host speaks.
#include "conformance/Cases.h"
#include "conformance/Operations.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

Outcome<Done> performed(Probe &probe, Operation const &operation, Subject const &subject) {
    return probe.ask(operation.perform(probe.provider(), probe.context(), subject));
}

void unknownContainer(Probe &probe, Operation const &operation) {
    auto const made = probe.make();
    Subject const subject{unknownId, made.uuid, probe.ground().endpoint(), probe.freshName()};
    expectFailure("a container that there is not", Wire::ErrorCode::NoSuchContainer,
                  performed(probe, operation, subject));
    expectEqual("the volume that was named, afterwards", made, probe.facts(made));
}

void unknownVolume(Probe &probe, Operation const &operation) {
    Subject const subject{probe.containerId(), unknownId, probe.ground().endpoint(), probe.freshName()};
    expectFailure("a volume that there is not", Wire::ErrorCode::NoSuchVolume, performed(probe, operation, subject));
}

void deletedVolume(Probe &probe, Operation const &operation) {
    auto const made = probe.make();
    probe.remove(made);
    Subject const subject{probe.containerId(), made.uuid, probe.ground().endpoint(), made.directoryName};
    expectFailure("a volume that was deleted", Wire::ErrorCode::NoSuchVolume, performed(probe, operation, subject));
}

void setContext(Probe &probe, std::optional<std::string> const &orkaContext) {
    auto context = probe.context();
    context.orkaContext = orkaContext;
    expectSuccess("a context that is told", probe.ask(probe.provider().setContext(std::move(context))));
}

/// A context is told, and whatever becomes of it, the provider goes on serving.
void servesUnder(Probe &probe, std::optional<std::string> const &orkaContext) {
    setContext(probe, orkaContext);
    auto context = probe.context();
    context.orkaContext = orkaContext;
    auto const made =
        expectSuccess("a volume made on its behalf",
                      probe.ask(probe.provider().createVirtualVolume(std::move(context), probe.freshSpec())));
    expectEqual("the volume", made, probe.facts(made));
    setContext(probe, std::nullopt);
    expectEqual("the volume after the context was taken back", made, probe.facts(made));
}

} // namespace

Cases unknownNameCases() {
    Cases cases;
    for (auto const &operation : operations()) {
        if (operation.namesContainer) {
            cases.push_back({std::string("unknown-container/") + operation.name,
                             std::string("Of a container that there is not, \"") + operation.name +
                                 "\" says that there is no such container.",
                             [operation](Probe &probe) { unknownContainer(probe, operation); }});
        }
    }
    for (auto const &operation : operations()) {
        if (operation.namesVolume) {
            cases.push_back({std::string("unknown-volume/") + operation.name,
                             std::string("Of a volume that there is not, \"") + operation.name +
                                 "\" says that there is no such volume.",
                             [operation](Probe &probe) { unknownVolume(probe, operation); }});
        }
    }
    for (auto const &operation : operations()) {
        if (operation.namesVolume) {
            cases.push_back({std::string("deleted-volume/") + operation.name,
                             std::string("Of a volume that was deleted, \"") + operation.name +
                                 "\" says that there is no such volume.",
                             [operation](Probe &probe) { deletedVolume(probe, operation); }});
        }
    }
    return cases;
}

Cases contextCases() {
    return {
        {"context/set", "A context can be told, and the provider serves under it.",
         [](Probe &probe) { servesUnder(probe, "orka-kit"); }},
        {"context/cleared", "A host can speak on nobody's behalf.",
         [](Probe &probe) { servesUnder(probe, std::nullopt); }},
        {"context/empty", "An empty context is one too.", [](Probe &probe) { servesUnder(probe, ""); }},
        {"context/repeated", "A context that is told again is success.",
         [](Probe &probe) {
             setContext(probe, "orka-kit");
             servesUnder(probe, "orka-kit");
         }},
        {"context/not-told-before", "An operation may carry a context that was not told before.",
         [](Probe &probe) {
             auto context = probe.context();
             context.orkaContext = "orka-kit-never-told";
             expectSuccess("the storage arrays", probe.ask(probe.provider().queryStorageArray(std::move(context))));
         }},
    };
}

} // namespace Orka::Conformance
