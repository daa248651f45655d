// SPDX-License-Identifier: Apache-2.0
#include "conformance/Operations.h"

namespace Orka::Conformance {

namespace {

using Answered = kj::Promise<Outcome<Done>>;

template <typename T>
Answered dropAnswer(kj::Promise<Outcome<T>> promise) {
    return promise.then([](Outcome<T> &&outcome) -> Outcome<Done> {
        if (!outcome.ok()) {
            return outcome.failure();
        }
        return Done{};
    });
}

Answered create(Provider &provider, CallContext context, Subject const &subject) {
    VolumeSpec spec;
    spec.containerId = subject.containerId;
    spec.directoryName = subject.name;
    return dropAnswer(provider.createVirtualVolume(std::move(context), std::move(spec)));
}

} // namespace

std::vector<Operation> const &operations() {
    static std::vector<Operation> const all{
        {"query-arrays", false, false,
         [](Provider &provider, CallContext context, Subject const &) {
             return dropAnswer(provider.queryStorageArray(std::move(context)));
         }},
        {"query-containers", false, false,
         [](Provider &provider, CallContext context, Subject const &) {
             return dropAnswer(provider.queryStorageContainer(std::move(context)));
         }},
        {"create", true, false, create},
        {"delete", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return provider.deleteVirtualVolume(std::move(context), subject.containerId, subject.uuid);
         }},
        {"bind", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return provider.bindVirtualVolume(std::move(context), subject.containerId, subject.uuid, subject.endpoint);
         }},
        {"unbind", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return provider.unbindVirtualVolume(std::move(context), subject.containerId, subject.uuid);
         }},
        {"query-volume", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(provider.queryVirtualVolume(std::move(context), subject.containerId, subject.uuid));
         }},
        {"list", true, false,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(provider.queryVirtualVolumesOfContainer(std::move(context), subject.containerId, 10));
         }},
        {"query-by-id", true, false,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(
                 provider.queryVirtualVolumesById(std::move(context), subject.containerId, {subject.uuid}));
         }},
        {"query-by-name", true, false,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(
                 provider.queryVirtualVolumeByDirectoryName(std::move(context), subject.containerId, subject.name));
         }},
        {"query-bound", false, false,
         [](Provider &provider, CallContext context, Subject const &) {
             return dropAnswer(provider.queryVirtualVolumesBound(std::move(context)));
         }},
        {"space-stats", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(
                 provider.spaceStatsForVirtualVolume(std::move(context), subject.containerId, subject.uuid));
         }},
        {"unshared-chunks", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(
                 provider.unsharedChunksVirtualVolume(std::move(context), subject.containerId, subject.uuid));
         }},
        {"metadata", true, true,
         [](Provider &provider, CallContext context, Subject const &subject) {
             return dropAnswer(provider.getMetadata(std::move(context), subject.containerId, subject.uuid));
         }},
        {"set-context", false, false,
         [](Provider &provider, CallContext context, Subject const &) {
             return provider.setContext(std::move(context));
         }},
    };
    return all;
}

} // namespace Orka::Conformance
