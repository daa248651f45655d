// SPDX-License-Identifier: Apache-2.0
//
// Connections that are cut in the middle of a mutation, and processes that are killed at one. Whoever asked does not
// know whether it took place, asks again with the same key, and there is exactly one effect.
#include "conformance/Cases.h"
#include "conformance/Probe.h"
#include "conformance/VictimProcess.h"

namespace Orka::Conformance {

namespace {

using Uid = std::optional<std::string>;

/// A mutation that is about to be performed, and how to tell that it took effect once.
struct Prepared {
    VolumeSpec spec;      ///< of what is made
    VirtualVolume volume; ///< that is changed
    std::string endpoint;
};

struct Mutation {
    char const *name;
    Prepared (*prepare)(Probe &probe);
    kj::Promise<Outcome<Done>> (*perform)(Provider &provider, CallContext context, Prepared const &prepared);
    /// After the mutation has been repeated with its key and succeeded; repeats it once more.
    void (*checkOnce)(Probe &probe, Prepared const &prepared, std::string const &key);
    /// What a victim is told behind its key.
    std::vector<std::string> (*words)(Prepared const &prepared);
};

Outcome<Done> repeat(Probe &probe, Mutation const &mutation, Prepared const &prepared, std::string const &key) {
    return probe.ask(mutation.perform(probe.provider(), probe.context(key), prepared));
}

kj::Promise<Outcome<Done>> performCreate(Provider &provider, CallContext context, Prepared const &prepared) {
    return provider.createVirtualVolume(std::move(context), prepared.spec)
        .then([](Outcome<VirtualVolume> &&outcome) -> Outcome<Done> {
            if (!outcome.ok()) {
                return outcome.failure();
            }
            return Done{};
        });
}

void createdOnce(Probe &probe, Prepared const &prepared, std::string const &key) {
    auto const &name = prepared.spec.directoryName;
    expectEqual("how many volumes have the name", int64_t{1}, probe.countNamed(name));
    auto const found = probe.byName(probe.containerId(), name);
    auto const answer = expectSuccess("the making repeated", probe.tryMake(prepared.spec, key));
    expectEqual("the volume in the answer", found, std::optional<VirtualVolume>(answer));
    probe.remove(answer);
    expectSuccess("the making repeated after a deletion", probe.tryMake(prepared.spec, key));
    expectEqual("how many volumes have the name in the end", int64_t{0}, probe.countNamed(name));
}

void deletedOnce(Probe &probe, Prepared const &prepared, std::string const &key) {
    expectEqual("whether it is known", false, probe.exists(prepared.volume));
    auto spec = probe.freshSpec();
    spec.directoryName = prepared.volume.directoryName;
    auto const successor = probe.make(spec);
    expectSuccess("the deletion repeated", probe.tryRemove(prepared.volume, key));
    expectEqual("whether a new volume of its name is there", true, probe.exists(successor));
}

void boundOnce(Probe &probe, Prepared const &prepared, std::string const &key) {
    expectEqual("what it is bound through", Uid(prepared.endpoint), probe.facts(prepared.volume).boundTo);
    probe.unbind(prepared.volume);
    expectSuccess("the binding repeated", probe.tryBind(prepared.volume, prepared.endpoint, key));
    expectEqual("what it is bound through in the end", Uid(), probe.facts(prepared.volume).boundTo);
}

void unboundOnce(Probe &probe, Prepared const &prepared, std::string const &key) {
    expectEqual("what it is bound through", Uid(), probe.facts(prepared.volume).boundTo);
    probe.bind(prepared.volume, prepared.endpoint);
    expectSuccess("the unbinding repeated", probe.tryUnbind(prepared.volume, key));
    expectEqual("what it is bound through in the end", Uid(prepared.endpoint), probe.facts(prepared.volume).boundTo);
}

std::vector<Mutation> const &mutations() {
    static std::vector<Mutation> const all{
        {"create",
         [](Probe &probe) {
             return Prepared{probe.freshSpec(), {}, ""};
         },
         performCreate, createdOnce,
         [](Prepared const &prepared) {
             return std::vector<std::string>{"create", prepared.spec.containerId, prepared.spec.directoryName};
         }},
        {"delete",
         [](Probe &probe) {
             return Prepared{{}, probe.make(), ""};
         },
         [](Provider &provider, CallContext context, Prepared const &prepared) {
             return provider.deleteVirtualVolume(std::move(context), prepared.volume.containerId, prepared.volume.uuid);
         },
         deletedOnce,
         [](Prepared const &prepared) {
             return std::vector<std::string>{"delete", prepared.volume.containerId, prepared.volume.uuid};
         }},
        {"bind",
         [](Probe &probe) {
             return Prepared{{}, probe.make(), probe.ground().endpoint()};
         },
         [](Provider &provider, CallContext context, Prepared const &prepared) {
             return provider.bindVirtualVolume(std::move(context), prepared.volume.containerId, prepared.volume.uuid,
                                               prepared.endpoint);
         },
         boundOnce,
         [](Prepared const &prepared) {
             return std::vector<std::string>{"bind", prepared.volume.containerId, prepared.volume.uuid,
                                             prepared.endpoint};
         }},
        {"unbind",
         [](Probe &probe) {
             Prepared prepared{{}, probe.make(), probe.ground().endpoint()};
             probe.bind(prepared.volume, prepared.endpoint);
             return prepared;
         },
         [](Provider &provider, CallContext context, Prepared const &prepared) {
             return provider.unbindVirtualVolume(std::move(context), prepared.volume.containerId, prepared.volume.uuid);
         },
         unboundOnce,
         [](Prepared const &prepared) {
             return std::vector<std::string>{"unbind", prepared.volume.containerId, prepared.volume.uuid};
         }},
    };
    return all;
}

void finish(Probe &probe, Mutation const &mutation, Prepared const &prepared, std::string const &key) {
    probe.reconnect();
    expectSuccess("the mutation repeated with its key", repeat(probe, mutation, prepared, key));
    mutation.checkOnce(probe, prepared, key);
}

void cutBeforeItBegins(Probe &probe, Mutation const &mutation) {
    auto const prepared = mutation.prepare(probe);
    auto const key = probe.freshKey();
    {
        auto const connection = probe.connect();
        auto const promise = mutation.perform(*connection, probe.context(key), prepared);
    }
    finish(probe, mutation, prepared, key);
}

void cutOnTheWay(Probe &probe, Mutation const &mutation) {
    for (auto const longest : {1U, 200U, 1000U, 4000U, 20000U}) {
        auto const prepared = mutation.prepare(probe);
        auto const key = probe.freshKey();
        {
            auto const connection = probe.connect();
            auto const promise = mutation.perform(*connection, probe.context(key), prepared)
                                     .then([](Outcome<Done> &&) {}, [](kj::Exception &&) {})
                                     .eagerlyEvaluate(nullptr);
            probe.pass(probe.choose(longest) * kj::MICROSECONDS);
        }
        finish(probe, mutation, prepared, key);
    }
}

void cutAfterTheAnswer(Probe &probe, Mutation const &mutation) {
    auto const prepared = mutation.prepare(probe);
    auto const key = probe.freshKey();
    {
        auto const connection = probe.connect();
        expectSuccess("the mutation", probe.ask(mutation.perform(*connection, probe.context(key), prepared)));
    }
    finish(probe, mutation, prepared, key);
}

void killed(Probe &probe, Mutation const &mutation, bool answered) {
    if (probe.surroundings().victim.empty()) {
        throw Inapplicable{"no program was named that can be killed"};
    }
    int const timeoutMs = static_cast<int>(probe.surroundings().timeout / kj::MILLISECONDS);
    auto const prepared = mutation.prepare(probe);
    auto const key = probe.freshKey();
    auto words = probe.surroundings().victim;
    words.push_back(key);
    for (auto const &word : mutation.words(prepared)) {
        words.push_back(word);
    }
    {
        VictimProcess process(words);
        process.awaitLine("begun", timeoutMs);
        if (answered) {
            process.awaitLine("answered", timeoutMs);
        }
        process.kill();
    }
    finish(probe, mutation, prepared, key);
}

} // namespace

Cases cutCases() {
    struct Moment {
        char const *name;
        char const *demand;
        void (*run)(Probe &probe, Mutation const &mutation);
    };
    std::vector<Moment> const moments{
        {"before", "is cut off before it begins", cutBeforeItBegins},
        {"on-the-way", "is cut off at some moment on its way", cutOnTheWay},
        {"after", "is cut off after its answer", cutAfterTheAnswer},
        {"killed-at-once", "is asked by a process that is killed at once",
         [](Probe &probe, Mutation const &mutation) { killed(probe, mutation, false); }},
        {"killed-after", "is asked by a process that is killed after the answer",
         [](Probe &probe, Mutation const &mutation) { killed(probe, mutation, true); }},
    };
    Cases cases;
    for (auto const &mutation : mutations()) {
        for (auto const &moment : moments) {
            cases.push_back({std::string("cut/") + mutation.name + '/' + moment.name,
                             std::string("A \"") + mutation.name + "\" that " + moment.demand +
                                 " and is repeated with its key takes effect once.",
                             [mutation, run = moment.run](Probe &probe) { run(probe, mutation); }});
        }
    }
    return cases;
}

} // namespace Orka::Conformance
