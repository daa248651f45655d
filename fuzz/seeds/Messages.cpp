// SPDX-License-Identifier: Apache-2.0
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include <capnp/message.h>
#include <capnp/serialize.h>

#include "BothApis.h"
#include "Seeds.h"

namespace Fuzz {

namespace {

/// Any bytes, always the same.
BothApis::Choices someChoices() {
    std::vector<std::uint8_t> bytes(400);
    std::uint32_t state = 12345;
    for (std::uint8_t &byte : bytes) {
        state = state * 1664525 + 1013904223;
        byte = static_cast<std::uint8_t>(state >> 24);
    }
    return BothApis::Choices(std::move(bytes));
}

std::string streamed(capnp::MessageBuilder &message) {
    auto const words = capnp::messageToFlatArray(message);
    return {words.asChars().begin(), words.asChars().size()};
}

/// The whole answer to request 1, and which request of the target it answers.
class Answer {
public:
    explicit Answer(char request)
        : bytes_(1, request) {}

    Answer &then(bool last, std::function<void(Wire::Reply::Builder)> const &fill) {
        capnp::MallocMessageBuilder message;
        auto reply = message.initRoot<Wire::Reply>();
        reply.setId(1);
        reply.setLast(last);
        fill(reply);
        bytes_ += streamed(message);
        return *this;
    }
    std::string const &bytes() const {
        return bytes_;
    }

private:
    std::string bytes_;
};

void fillArrays(Wire::Reply::Builder reply) {
    auto array = reply.initStorageArrays(2)[0];
    array.setId("array");
    array.setName("name");
    auto endpoints = array.initEndpoints(2);
    endpoints[0].setUid("endpoint");
    endpoints[0].setText1("lun");
    endpoints[1].setType(2);
    endpoints[1].initAddresses(2).set(0, "10.0.0.1");
}

void fillContainers(Wire::Reply::Builder reply) {
    auto containers = reply.initStorageContainers(2);
    for (auto container : containers) {
        container.setId("0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9");
        container.setName("gold");
        container.setProviderUrl("file:///a.array");
        container.setMaxLumoSizeMb(4096);
        auto arrays = container.initArrays(2);
        arrays.set(0, 1);
        arrays.set(1, 0);
    }
}

} // namespace

void makeMessageSeeds(Keep const &keep) {
    // Tiny segments make far and double-far pointers.
    for (unsigned const words : {0U, 16U}) {
        auto const strategy = words > 0 ? capnp::AllocationStrategy::FIXED_SIZE : capnp::SUGGESTED_ALLOCATION_STRATEGY;
        std::string const suffix = words > 0 ? "_in_many_segments" : "";
        for (unsigned kind = 0; kind < BothApis::replyKinds; ++kind) {
            capnp::MallocMessageBuilder message(words, strategy);
            BothApis::fill(message.initRoot<Wire::Reply>(), kind, someChoices());
            keep("reply_" + std::to_string(kind) + suffix, streamed(message));
        }
        for (unsigned kind = 0; kind < BothApis::requestKinds; ++kind) {
            capnp::MallocMessageBuilder message(words, strategy);
            BothApis::fill(message.initRoot<Wire::Request>(), kind, someChoices());
            keep("request_" + std::to_string(kind) + suffix, streamed(message));
        }
    }
}

void makeReplySeeds(Keep const &keep) {
    keep("containers", Answer(0).then(false, fillArrays).then(true, fillContainers).bytes());
    keep("containers_in_two",
         Answer(0).then(false, fillArrays).then(false, fillContainers).then(true, fillContainers).bytes());
    keep("config_lumos", Answer(1)
                             .then(true,
                                   [](Wire::Reply::Builder reply) {
                                       auto lumo = reply.initConfigLumos(2)[0];
                                       lumo.setUuid("11111111-2222-3333-4444-555555555555");
                                       lumo.setDirectoryName("directory");
                                   })
                             .bytes());
    keep("space_stats",
         Answer(2).then(true, [](Wire::Reply::Builder reply) { reply.initSpaceStats().setLogicalSizeMb(7); }).bytes());
    keep("lumo_info",
         Answer(3).then(true, [](Wire::Reply::Builder reply) { reply.initLumoInfo().setStorageProfile("p"); }).bytes());
    keep("unshared_chunks", Answer(4)
                                .then(true,
                                      [](Wire::Reply::Builder reply) {
                                          auto chunks = reply.initUnsharedChunks();
                                          chunks.setBlockSize(512);
                                          chunks.initBitmap(9)[8] = 5;
                                      })
                                .bytes());
    keep("metadata", Answer(5)
                         .then(true,
                               [](Wire::Reply::Builder reply) {
                                   auto pair = reply.initMetadata(2)[0];
                                   pair.setKey("key");
                                   pair.setValue("value");
                               })
                         .bytes());
    keep("done", Answer(6).then(true, [](Wire::Reply::Builder reply) { reply.setDone(); }).bytes());
    keep("failure", Answer(6)
                        .then(true,
                              [](Wire::Reply::Builder reply) {
                                  auto failure = reply.initFailure();
                                  failure.setCode(24);
                                  failure.setSentence("there is no such volume");
                              })
                        .bytes());
}

} // namespace Fuzz
