// SPDX-License-Identifier: Apache-2.0
//
// Several connections at once: one after the other in effect, and nothing lost.
#include <algorithm>
#include <set>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

using Wire::ErrorCode;

template <typename T>
using Answers = std::vector<kj::Promise<Outcome<T>>>;

std::vector<std::unique_ptr<Provider>> connections(Probe &probe, size_t count) {
    std::vector<std::unique_ptr<Provider>> made;
    for (size_t index = 0; index < count; ++index) {
        made.push_back(probe.connect());
    }
    return made;
}

/// Waits for all of them, in an order that the seed decides.
template <typename T>
std::vector<Outcome<T>> gather(Probe &probe, Answers<T> promises) {
    std::vector<std::optional<Outcome<T>>> found(promises.size());
    std::vector<size_t> order(promises.size());
    for (size_t index = 0; index < order.size(); ++index) {
        order[index] = index;
    }
    for (size_t index = order.size(); index > 1; --index) {
        std::swap(order[index - 1], order[probe.choose(static_cast<uint32_t>(index))]);
    }
    for (auto const index : order) {
        found[index] = probe.ask(kj::mv(promises[index]));
    }
    std::vector<Outcome<T>> outcomes;
    for (auto &outcome : found) {
        outcomes.push_back(*std::move(outcome));
    }
    return outcomes;
}

/// Exactly one succeeded, and every other failed with one of the codes. @return which succeeded
template <typename T>
size_t theWinner(std::vector<Outcome<T>> const &outcomes, std::initializer_list<ErrorCode> losing) {
    std::optional<size_t> winner;
    for (size_t index = 0; index < outcomes.size(); ++index) {
        if (!outcomes[index].ok()) {
            expectFailure("one succeeds and the others are refused", losing, outcomes[index]);
            continue;
        }
        expectTrue("exactly one succeeds", !winner, "a second one did: " + show(outcomes[index]));
        winner = index;
    }
    expectTrue("exactly one succeeds", winner.has_value(), "none did");
    return *winner;
}

void createOneName(Probe &probe, size_t count) {
    // Two that meet are a matter of luck, the more so with a network in between.
    constexpr int rounds = 10;
    auto const providers = connections(probe, count);
    for (int round = 0; round < rounds; ++round) {
        auto const spec = probe.freshSpec();
        Answers<VirtualVolume> promises;
        for (auto const &provider : providers) {
            promises.push_back(provider->createVirtualVolume(probe.context(), spec));
        }
        auto const outcomes = gather(probe, kj::mv(promises));
        auto const &made = outcomes[theWinner(outcomes, {ErrorCode::AlreadyExists})].value();
        expectEqual("how many volumes have the name", int64_t{1}, probe.countNamed(spec.directoryName));
        expectEqual("the winner's volume", made, probe.facts(made));
    }
}

void oneKey(Probe &probe) {
    auto const providers = connections(probe, 4);
    auto const spec = probe.freshSpec();
    auto const key = probe.freshKey();
    Answers<VirtualVolume> promises;
    for (auto const &provider : providers) {
        promises.push_back(provider->createVirtualVolume(probe.context(key), spec));
    }
    auto const outcomes = gather(probe, kj::mv(promises));
    for (auto const &outcome : outcomes) {
        expectEqual("one answer for all that have the key", expectSuccess("a volume", outcomes[0]),
                    expectSuccess("a volume", outcome));
    }
    expectEqual("how many volumes have the name", int64_t{1}, probe.countNamed(spec.directoryName));
}

void manyNames(Probe &probe) {
    auto const providers = connections(probe, 4);
    constexpr size_t count = 40;
    Answers<VirtualVolume> promises;
    for (size_t index = 0; index < count; ++index) {
        promises.push_back(
            providers[index % providers.size()]->createVirtualVolume(probe.context(), probe.freshSpec()));
    }
    std::set<std::string> made;
    for (auto const &outcome : gather(probe, kj::mv(promises))) {
        made.insert(expectSuccess("a volume", outcome).uuid);
    }
    expectEqual("how many ids there are", uint64_t{count}, uint64_t{made.size()});
    size_t listed = 0;
    for (auto const &volume : probe.list(probe.containerId())) {
        listed += made.count(volume.uuid);
    }
    expectEqual("how many of them are listed", uint64_t{count}, uint64_t{listed});
}

void bindTwoEndpoints(Probe &probe) {
    auto const providers = connections(probe, 2);
    std::vector<std::string> const endpoints{probe.ground().endpoint(), probe.ground().secondEndpoint()};
    for (int round = 0; round < 5; ++round) {
        auto const made = probe.make();
        Answers<Done> promises;
        for (size_t index = 0; index < 2; ++index) {
            promises.push_back(
                providers[index]->bindVirtualVolume(probe.context(), made.containerId, made.uuid, endpoints[index]));
        }
        auto const winner = theWinner(gather(probe, kj::mv(promises)), {ErrorCode::InUse});
        expectEqual("what it is bound through", std::optional<std::string>(endpoints[winner]),
                    probe.facts(made).boundTo);
    }
}

void deleteTwice(Probe &probe) {
    auto const providers = connections(probe, 3);
    for (int round = 0; round < 5; ++round) {
        auto const made = probe.make();
        Answers<Done> promises;
        for (auto const &provider : providers) {
            promises.push_back(provider->deleteVirtualVolume(probe.context(), made.containerId, made.uuid));
        }
        theWinner(gather(probe, kj::mv(promises)), {ErrorCode::NoSuchVolume});
        expectEqual("whether it is known", false, probe.exists(made));
    }
}

void deleteAndBind(Probe &probe) {
    auto const providers = connections(probe, 2);
    for (int round = 0; round < 6; ++round) {
        auto const made = probe.make();
        auto const binder = probe.choose(2);
        Answers<Done> promises;
        for (size_t index = 0; index < 2; ++index) {
            promises.push_back(
                index == binder ? providers[index]->bindVirtualVolume(probe.context(), made.containerId, made.uuid,
                                                                      probe.ground().endpoint())
                                : providers[index]->deleteVirtualVolume(probe.context(), made.containerId, made.uuid));
        }
        auto const winner = theWinner(gather(probe, kj::mv(promises)), {ErrorCode::InUse, ErrorCode::NoSuchVolume});
        expectEqual("whether it is there", winner == binder, probe.exists(made));
    }
}

void otherVolumes(Probe &probe) {
    auto const providers = connections(probe, 4);
    std::vector<VirtualVolume> made;
    Answers<Done> promises;
    for (size_t index = 0; index < 16; ++index) {
        made.push_back(probe.make());
    }
    for (size_t index = 0; index < made.size(); ++index) {
        promises.push_back(providers[index % providers.size()]->bindVirtualVolume(
            probe.context(), made[index].containerId, made[index].uuid, probe.ground().endpoint()));
    }
    for (auto const &outcome : gather(probe, kj::mv(promises))) {
        expectSuccess("binding one of many volumes", outcome);
    }
    for (auto const &volume : made) {
        expectEqual("what each is bound through", std::optional<std::string>(probe.ground().endpoint()),
                    probe.facts(volume).boundTo);
    }
}

void readsDuringWrites(Probe &probe) {
    auto const writer = probe.connect();
    auto const reader = probe.connect();
    Answers<VirtualVolume> writes;
    Answers<std::vector<ConfigVolume>> reads;
    std::vector<std::string> names;
    for (int count = 0; count < 20; ++count) {
        auto spec = probe.freshSpec();
        names.push_back(spec.directoryName);
        writes.push_back(writer->createVirtualVolume(probe.context(), spec));
        reads.push_back(reader->queryVirtualVolumesOfContainer(probe.context(), probe.containerId(), everyVolume));
    }
    auto const lists = gather(probe, kj::mv(reads));
    for (auto const &outcome : gather(probe, kj::mv(writes))) {
        expectSuccess("a volume", outcome);
    }
    auto const whole = probe.list(probe.containerId());
    for (auto const &outcome : lists) {
        auto const seen = expectSuccess("a list", outcome);
        expectTrue("a list that was read meanwhile is a beginning of what there is at the end",
                   seen.size() <= whole.size() && std::equal(seen.begin(), seen.end(), whole.begin()), show(seen));
    }
    for (auto const &name : names) {
        expectEqual("how many volumes have a name", int64_t{1}, probe.countNamed(name));
    }
}

void manyPending(Probe &probe) {
    auto const made = probe.make();
    Answers<VirtualVolume> promises;
    for (int count = 0; count < 256; ++count) {
        promises.push_back(probe.provider().queryVirtualVolume(probe.context(), made.containerId, made.uuid));
    }
    for (auto const &outcome : gather(probe, kj::mv(promises))) {
        expectEqual("the volume", made, expectSuccess("its facts", outcome));
    }
}

} // namespace

Cases concurrencyCases() {
    return {
        {"concurrency/create/two", "Of two that make a volume of one name, exactly one does.",
         [](Probe &probe) { createOneName(probe, 2); }},
        {"concurrency/create/sixteen", "Of sixteen that make a volume of one name, exactly one does.",
         [](Probe &probe) { createOneName(probe, 16); }},
        {"concurrency/create/one-key", "Four that make a volume with one key are given the same one.", oneKey},
        {"concurrency/create/many-names", "Of forty volumes made through four connections, none is lost.", manyNames},
        {"concurrency/bind/two-endpoints", "Of two that bind a volume to two endpoints, exactly one does.",
         bindTwoEndpoints},
        {"concurrency/bind/other-volumes", "Bindings of different volumes do not disturb each other.", otherVolumes},
        {"concurrency/delete/three", "Of three that delete a volume, exactly one does.", deleteTwice},
        {"concurrency/delete/against-bind", "Of a deletion and a binding of one volume, exactly one succeeds.",
         deleteAndBind},
        {"concurrency/list/during-create", "A list that is read while volumes are made has the oldest, in order.",
         readsDuringWrites},
        {"concurrency/query/many-pending", "256 questions of one connection are all answered.", manyPending},
    };
}

} // namespace Orka::Conformance
