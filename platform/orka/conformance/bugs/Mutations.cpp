// SPDX-License-Identifier: Apache-2.0
//
// Bugs in what changes an array.
#include <algorithm>

#include "conformance/bugs/Forwarding.h"

namespace Orka::Conformance {

namespace {

/// The volume that has the name already, as if it had just been made.
kj::Promise<Outcome<VirtualVolume>> theOneThatIsThere(kj::Own<Inner> inner, CallContext context, VolumeSpec spec) {
    context.idempotencyKey.clear();
    auto promise =
        inner->provider->queryVirtualVolumeByDirectoryName(std::move(context), spec.containerId, spec.directoryName);
    return promise
        .then([](Outcome<std::optional<VirtualVolume>> &&found) -> Outcome<VirtualVolume> {
            if (!found.ok() || !found.value()) {
                return Wire::Failure(Wire::ErrorCode::InternalError, "the volume of the name has gone");
            }
            return *found.value();
        })
        .attach(kj::mv(inner));
}

class AcceptsTakenName final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto promise = Forwarding::createVirtualVolume(context, spec);
        return otherwise(kj::mv(promise), Wire::ErrorCode::AlreadyExists,
                         [inner = share(), context, spec](Wire::Failure const &) mutable {
                             return theOneThatIsThere(kj::mv(inner), context, spec);
                         });
    }
};

/// Looks first and makes then; who loses the race in between is told that all went well.
class LooksThenMakes final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto looking = Forwarding::queryVirtualVolumeByDirectoryName(context, spec.containerId, spec.directoryName);
        return looking.then([inner = share(), context,
                             spec](Outcome<std::optional<VirtualVolume>> &&found) mutable -> Answer<VirtualVolume> {
            auto promise = inner->provider->createVirtualVolume(context, spec);
            if (!context.idempotencyKey.empty() || !found.ok() || found.value()) {
                return promise.attach(kj::mv(inner));
            }
            return otherwise(kj::mv(promise), Wire::ErrorCode::AlreadyExists,
                             [inner = kj::mv(inner), context, spec](Wire::Failure const &) mutable {
                                 return theOneThatIsThere(kj::mv(inner), context, spec);
                             });
        });
    }
};

/// Makes the size fit instead of refusing it.
class ClampsSize final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto promise = Forwarding::createVirtualVolume(context, spec);
        return otherwise(kj::mv(promise), Wire::ErrorCode::TooLarge,
                         [inner = share(), context, spec](Wire::Failure const &) mutable {
                             spec.sizeMb = 0;
                             return inner->provider->createVirtualVolume(context, spec).attach(kj::mv(inner));
                         });
    }
};

class NegativeIsDefault final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        spec.sizeMb = std::max<int64_t>(spec.sizeMb, 0);
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

class EmptyProfileIsNone final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        if (spec.profile == "") {
            spec.profile.reset();
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

class CutsNames final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        constexpr size_t most = 128;
        if (spec.directoryName.size() > most) {
            spec.directoryName.resize(most);
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

class TrimsNames final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        while (!spec.directoryName.empty() && spec.directoryName.back() == ' ') {
            spec.directoryName.pop_back();
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

/// Takes the binding away for whoever deletes.
class DeletesBound final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Done> deleteVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        auto promise = Forwarding::deleteVirtualVolume(context, containerId, uuid);
        return otherwise(
            kj::mv(promise), Wire::ErrorCode::InUse,
            [inner = share(), context, containerId, uuid](Wire::Failure const &) mutable {
                auto const key = std::exchange(context.idempotencyKey, "");
                auto &provider = *inner->provider;
                return provider.unbindVirtualVolume(context, containerId, uuid)
                    .then([inner = kj::mv(inner), context, key, containerId, uuid](Outcome<Done> &&) mutable {
                        context.idempotencyKey = key;
                        return inner->provider->deleteVirtualVolume(context, containerId, uuid).attach(kj::mv(inner));
                    });
            });
    }
};

class BindsAnywhere final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                   std::string endpointUid) override {
        return otherwise(Forwarding::bindVirtualVolume(std::move(context), containerId, uuid, endpointUid),
                         Wire::ErrorCode::NoSuchEndpoint,
                         [](Wire::Failure const &) -> Answer<Done> { return Outcome<Done>(Done{}); });
    }
};

/// Takes another endpoint's place without asking.
class Rebinds final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                   std::string endpointUid) override {
        auto promise = Forwarding::bindVirtualVolume(context, containerId, uuid, endpointUid);
        return otherwise(kj::mv(promise), Wire::ErrorCode::InUse,
                         [inner = share(), context, containerId, uuid, endpointUid](Wire::Failure const &) mutable {
                             auto const key = std::exchange(context.idempotencyKey, "");
                             auto &provider = *inner->provider;
                             return provider.unbindVirtualVolume(context, containerId, uuid)
                                 .then([inner = kj::mv(inner), context, key, containerId, uuid,
                                        endpointUid](Outcome<Done> &&) mutable {
                                     context.idempotencyKey = key;
                                     return inner->provider->bindVirtualVolume(context, containerId, uuid, endpointUid)
                                         .attach(kj::mv(inner));
                                 });
                         });
    }
};

/// Does not take "not bound" for success.
class UnbindFailsWhenFree final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Done> unbindVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        return Forwarding::queryVirtualVolume(context, containerId, uuid)
            .then(
                [inner = share(), context, containerId, uuid](Outcome<VirtualVolume> &&found) mutable -> Answer<Done> {
                    if (found.ok() && !found.value().boundTo) {
                        return Outcome<Done>(Wire::Failure(Wire::ErrorCode::InUse, "the volume is not bound"));
                    }
                    return inner->provider->unbindVirtualVolume(context, containerId, uuid).attach(kj::mv(inner));
                });
    }
};

} // namespace

std::vector<Bug> mutationBugs() {
    return {
        {"accepts-taken-name", "Making a volume of a name that is taken gives the one that is there.",
         "volume/create/name-taken", put<AcceptsTakenName>},
        {"looks-then-makes", "Of two that make one name at once, the loser is told that it has made it.",
         "concurrency/create/sixteen", put<LooksThenMakes>},
        {"clamps-size", "A size above the maximum becomes the default.", "volume/create/size-above-maximum",
         put<ClampsSize>},
        {"negative-is-default", "A negative size becomes the default.", "volume/create/size-negative",
         put<NegativeIsDefault>},
        {"empty-profile-is-none", "An empty profile is stored as none.", "volume/create/profile-empty",
         put<EmptyProfileIsNone>},
        {"cuts-names", "Names are cut at 128 bytes.", "hostile/name/255-bytes", put<CutsNames>},
        {"trims-names", "Blanks at a name's end are taken away.", "hostile/name/trailing-blank", put<TrimsNames>},
        {"deletes-bound", "A volume that is bound is unbound and deleted.", "volume/delete/bound", put<DeletesBound>},
        {"binds-anywhere", "Binding to an endpoint that there is not is success.", "volume/bind/endpoint-unknown",
         put<BindsAnywhere>},
        {"rebinds", "A volume that is bound is bound to another endpoint instead.", "volume/bind/other-endpoint",
         put<Rebinds>},
        {"unbind-fails-when-free", "Unbinding a volume that is not bound fails.", "volume/unbind/not-bound",
         put<UnbindFailsWhenFree>},
    };
}

} // namespace Orka::Conformance
