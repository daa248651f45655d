// SPDX-License-Identifier: Apache-2.0
//
// Bugs in what makes a repetition harmless.
#include <map>

#include "conformance/bugs/Forwarding.h"

namespace Orka::Conformance {

namespace {

class IgnoresKeys final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        context.idempotencyKey.clear();
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

class IgnoresBindKeys final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                   std::string endpointUid) override {
        context.idempotencyKey.clear();
        return Forwarding::bindVirtualVolume(std::move(context), std::move(containerId), std::move(uuid),
                                             std::move(endpointUid));
    }
};

/// Another provider object, another space of keys.
class KeysOfOneConnection final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        if (!context.idempotencyKey.empty()) {
            context.idempotencyKey += ' ' + std::to_string(number_);
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }

private:
    static uint64_t next() {
        static uint64_t made = 0;
        return ++made;
    }
    uint64_t number_ = next();
};

/// What providers of one process that remember answers themselves share.
struct Remembered {
    std::map<std::string, Outcome<VirtualVolume>> answers;
    static Remembered &forKeys() {
        static Remembered all;
        return all;
    }
    static Remembered &ofFailures() {
        static Remembered all;
        return all;
    }
    static Remembered &afterAnswers() {
        static Remembered all;
        return all;
    }
};

/// Gives a key's first answer, whatever is asked for.
class KeyIsEnough final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto const key = context.idempotencyKey;
        auto const known = Remembered::forKeys().answers.find(key);
        if (!key.empty() && known != Remembered::forKeys().answers.end()) {
            return known->second;
        }
        return changed(Forwarding::createVirtualVolume(std::move(context), std::move(spec)),
                       [key](VirtualVolume &volume) { Remembered::forKeys().answers.emplace(key, volume); });
    }
};

/// Repeats a failure for ever.
class RemembersFailures final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto const key = context.idempotencyKey;
        auto const known = Remembered::ofFailures().answers.find(key);
        if (!key.empty() && known != Remembered::ofFailures().answers.end()) {
            return known->second;
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec))
            .then([key](Outcome<VirtualVolume> &&outcome) {
                if (!outcome.ok()) {
                    Remembered::ofFailures().answers.emplace(key, outcome);
                }
                return kj::mv(outcome);
            });
    }
};

/// Remembers a key when the answer has been given, not with the effect.
class RemembersAfterAnswer final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        auto const key = std::exchange(context.idempotencyKey, "");
        auto const known = Remembered::afterAnswers().answers.find(key);
        if (!key.empty() && known != Remembered::afterAnswers().answers.end()) {
            return known->second;
        }
        auto promise = Forwarding::createVirtualVolume(std::move(context), std::move(spec)).eagerlyEvaluate(nullptr);
        // As long as an answer is on its way.
        return promise.then([key, &clock = timer()](Outcome<VirtualVolume> &&outcome) mutable {
            return clock.afterDelay(30 * kj::MILLISECONDS).then([key, outcome = kj::mv(outcome)]() mutable {
                if (outcome.ok()) {
                    Remembered::afterAnswers().answers.emplace(key, outcome);
                }
                return kj::mv(outcome);
            });
        });
    }
};

/// Cuts keys to what its column holds.
class CutsKeys final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        constexpr size_t most = 255;
        if (context.idempotencyKey.size() > most) {
            context.idempotencyKey.resize(most);
        }
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
    }
};

} // namespace

std::vector<Bug> keyBugs() {
    return {
        {"ignores-keys", "A making that is repeated is a new one.", "idempotency/create/repeated", put<IgnoresKeys>},
        {"ignores-bind-keys", "A binding that is repeated is a new one.", "idempotency/bind/once",
         put<IgnoresBindKeys>},
        {"keys-of-one-connection", "A key is known only to the connection that it came through.",
         "idempotency/create/across-connections", put<KeysOfOneConnection>,
         "the server is one provider for all connections"},
        {"key-is-enough", "A key gets its first answer, whatever comes with it.", "idempotency/other/name",
         put<KeyIsEnough>},
        {"remembers-failures", "What failed once fails for ever under its key.", "idempotency/failure/tried-anew",
         put<RemembersFailures>},
        {"remembers-after-answer", "A key is remembered with the answer, not with the effect.", "cut/create/on-the-way",
         put<RemembersAfterAnswer>},
        {"cuts-keys", "Keys are cut at 255 bytes.", "idempotency/key/long", put<CutsKeys>},
    };
}

} // namespace Orka::Conformance
