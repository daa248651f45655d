// SPDX-License-Identifier: Apache-2.0
//
// A daemon that lies. Every lie is an error with a sentence, nothing is handed out, and the next request starts on a
// fresh connection.
#include "FakeDaemon.h"
#include "Host.h"

#include <capnp/serialize.h>

namespace LumoTest {

using Wire::ErrorCode;

class HostileReplies : public Host {
protected:
    /// Asks for the containers of a daemon that answers each request with the handler.
    /// @return the error's text
    std::string query(FakeDaemon::Handler handler) {
        FakeDaemon daemon(socket(), std::move(handler));
        EXPECT_TRUE(LumoLib_Init(0, 0));
        StorageContainerResult *result = nullptr;
        LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &result);
        EXPECT_EQ(result, nullptr);
        EXPECT_FALSE(LumoLib_ErrorExIsSuccess(&error));
        code_ = error.code;
        LumoLib_Exit();
        // The cause after the standing words about the daemon.
        std::string const text = lastFailure().substr(lastFailure().find(": ") + 2);
        std::string const standing = "the daemon at " + socket() + " ";
        return text.compare(0, standing.size(), standing) == 0 ? text.substr(standing.size()) : text;
    }

    std::string queryRaw(std::vector<std::uint64_t> const &words) {
        return query([words](Wire::Request::Reader, Peer &peer) { peer.raw(words.data(), 8 * words.size()); });
    }

    std::int32_t code_ = 0;
};

constexpr std::uint64_t table(std::uint64_t words) {
    return words << 32;
}

TEST_F(HostileReplies, fault_17_lengths) {
    EXPECT_EQ(queryRaw({table(0)}), "broke the protocol: a message announced an empty body");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
    EXPECT_EQ(queryRaw({table(0xFFFFFFFF)}),
              "broke the protocol: a message announced 34359738360 bytes, and at most 16777216 are allowed");
    EXPECT_EQ(code_, code(ErrorCode::MessageTooLarge));
    EXPECT_EQ(queryRaw({table(Wire::replyBytesMax / 8 + 1)}),
              "broke the protocol: a message announced 16777224 bytes, and at most 16777216 are allowed");
    EXPECT_EQ(code_, code(ErrorCode::MessageTooLarge));
    EXPECT_EQ(queryRaw({0xFFFFFFFFFFFFFFFF}), "broke the protocol: a message announced more than 64 segments");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_18_one_byte_at_a_time) {
    set("TOVI_TIMEOUT_MS", "150");
    auto const start = std::chrono::steady_clock::now();
    EXPECT_EQ(query([](Wire::Request::Reader, Peer &peer) {
                  std::uint64_t const head = table(1000);
                  peer.raw(&head, sizeof head);
                  char const byte = 0;
                  do {
                      peer.raw(&byte, 1);
                  } while (!peer.clientLeaves(10));
              }),
              "gave no answer within 150 ms");
    EXPECT_EQ(code_, code(ErrorCode::DeadlineExceeded));
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(150));
}

TEST_F(HostileReplies, fault_18_one_reply_at_a_time) {
    set("TOVI_TIMEOUT_MS", "150");
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) {
                  do {
                      peer.reply(
                          request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageContainers(1); }, false);
                  } while (!peer.clientLeaves(10));
              }),
              "gave no answer within 150 ms");
}

TEST_F(HostileReplies, fault_20_counts_beyond_the_message) {
    // Reply: root pointer, id 1, discriminant 6 (storageContainers) and last, then a list of 2^29 - 1 elements.
    std::uint64_t const root = (std::uint64_t{1} << 48) | (std::uint64_t{2} << 32);
    std::uint64_t const which = std::uint64_t{Wire::Reply::STORAGE_CONTAINERS} << 16;
    std::uint64_t const list = 1 | (std::uint64_t{7} << 32) | (std::uint64_t{0x1FFFFFFF} << 35);
    EXPECT_EQ(queryRaw({table(5), root, 1, which, list, 0}), "broke the protocol: its reply is malformed");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_24_a_root_that_points_outside) {
    EXPECT_EQ(queryRaw({table(1), (std::uint64_t{1} << 48) | (std::uint64_t{1000} << 2)}),
              "broke the protocol: its reply is malformed");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_24_a_text_without_an_end) {
    // A storageContainers reply of one element whose id is a text of 8 bytes, none of which is NUL.
    std::uint64_t const root = (std::uint64_t{1} << 48) | (std::uint64_t{2} << 32);
    std::uint64_t const which = std::uint64_t{Wire::Reply::STORAGE_CONTAINERS} << 16;
    std::uint64_t const list = 1 | (std::uint64_t{7} << 32) | (std::uint64_t{5} << 35);
    std::uint64_t const tag = (std::uint64_t{1} << 2) | (std::uint64_t{1} << 32) | (std::uint64_t{4} << 48);
    std::uint64_t const text = 1 | (std::uint64_t{3} << 2) | (std::uint64_t{2} << 32) | (std::uint64_t{8} << 35);
    EXPECT_EQ(queryRaw({table(11), root, 1, which, list, tag, 0, text, 0, 0, 0, 0x4141414141414141}),
              "broke the protocol: its reply is malformed");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
    // The same with the last byte NUL is an answer.
    std::vector<std::uint64_t> const proper = {table(11), root, 1, which, list, tag,
                                               0,         text, 0, 0,     0,    0x41414141414141};
    FakeDaemon daemon(socket(), [&](Wire::Request::Reader, Peer &peer) { peer.raw(proper.data(), 8 * proper.size()); });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    StorageContainerResult *result = nullptr;
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &result);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error)) << LumoLib_ErrorExStr(&error);
    EXPECT_STREQ(result->containers[0]->id, "AAAAAAA");
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(HostileReplies, fault_24_an_array_that_was_not_sent) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) {
                  peer.reply(
                      request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageArrays(1); }, false);
                  peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
                      reply.initStorageContainers(1)[0].initArrays(1).set(0, 1);
                  });
              }),
              "broke the protocol: a container names array 1 of 1");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_24_a_list_longer_than_a_chunk) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) {
                  peer.reply(request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageContainers(1001); });
              }),
              "broke the protocol: it sent a list of 1001 elements in one message");
}

TEST_F(HostileReplies, fault_24_an_answer_without_an_end) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        for (;;) {
            peer.reply(
                request.getId(), [](Wire::Reply::Builder reply) { reply.initConfigLumos(1)[0].initUuid(15 << 20); },
                false);
        }
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    LumoQueryResult *result = nullptr;
    EXPECT_EQ(LumoLib_QueryAllConfigLumos(containerId, 0, 0, &result, 0), code(ErrorCode::ProtocolError));
    EXPECT_EQ(lastFailure(),
              "5: the daemon at " + socket() + " broke the protocol: its answer is larger than 268435456 bytes");
    EXPECT_EQ(result, nullptr);
}

TEST_F(HostileReplies, fault_24_a_negative_size) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) {
                  peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
                      reply.initStorageContainers(1)[0].setMaxLumoSizeMb(-1);
                  });
              }),
              "broke the protocol: a container has a negative size");
}

TEST_F(HostileReplies, fault_24_another_kind_of_answer) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) {
                  peer.reply(request.getId(), [](Wire::Reply::Builder reply) { reply.initSpaceStats(); });
              }),
              "broke the protocol: it answered something else than storage containers");
}

TEST_F(HostileReplies, fault_24_a_kind_of_answer_that_does_not_exist) {
    std::uint64_t const root = (std::uint64_t{1} << 48) | (std::uint64_t{2} << 32);
    EXPECT_EQ(queryRaw({table(4), root, 1, std::uint64_t{999} << 16, 0}),
              "broke the protocol: it answered something else than storage containers");
}

TEST_F(HostileReplies, fault_24_every_inspection_refuses_another_kind_and_negative_sizes) {
    bool negative = false;
    FakeDaemon daemon(socket(), [&negative](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
            if (negative && request.isSpaceStatsForLumo()) {
                reply.initSpaceStats().setCommittedSizeMb(-1);
            } else if (negative && request.isUnsharedChunksLumo()) {
                reply.initUnsharedChunks().setBlockSize(-1);
            } else {
                reply.initPong();
            }
        });
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    LumoSpaceStats *stats = nullptr;
    LumoInfo *info = nullptr;
    LumoUnsharedChunks *chunks = nullptr;
    LumoMetadata *metadata = nullptr;
    LumoQueryResult *lumos = nullptr;
    std::int32_t const protocolError = code(ErrorCode::ProtocolError);
    EXPECT_EQ(LumoLib_SpaceStatsForLumo(containerId, volumeId, &stats), protocolError);
    EXPECT_EQ(LumoLib_GetLumoInfo(containerId, volumeId, &info), protocolError);
    EXPECT_EQ(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, &chunks), protocolError);
    EXPECT_EQ(LumoLib_GetLumoMetadata(containerId, volumeId, &metadata), protocolError);
    EXPECT_EQ(LumoLib_QueryAllConfigLumos(containerId, 10, 0, &lumos, 0), protocolError);
    EXPECT_EQ(LumoLib_DeactivateProvider("a", "p"), protocolError);
    EXPECT_FALSE(LumoLib_SetFaultInjectionEnabled(true));
    negative = true;
    EXPECT_EQ(LumoLib_SpaceStatsForLumo(containerId, volumeId, &stats), protocolError);
    EXPECT_EQ(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, &chunks), protocolError);
    EXPECT_EQ(lastFailure(), "5: the daemon at " + socket() + " broke the protocol: the block size is negative");
    EXPECT_EQ(stats, nullptr);
    EXPECT_EQ(info, nullptr);
    EXPECT_EQ(chunks, nullptr);
    EXPECT_EQ(metadata, nullptr);
    EXPECT_EQ(lumos, nullptr);
}

TEST_F(HostileReplies, fault_24_an_inspection_answered_with_several_replies_frees_all_but_the_last) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        auto const fill = [](Wire::Reply::Builder reply) { reply.initUnsharedChunks().setBlockSize(512); };
        peer.reply(request.getId(), fill, false);
        peer.reply(request.getId(), fill);
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    LumoUnsharedChunks *chunks = nullptr;
    ASSERT_EQ(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, &chunks), 0);
    EXPECT_EQ(chunks->blockSize, 512);
    std::free(chunks);
}

TEST_F(HostileReplies, fault_24_a_code_without_a_text) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) { peer.failure(request.getId(), 4711, ""); }),
              "unknown error");
    EXPECT_EQ(code_, 4711);
}

TEST_F(HostileReplies, fault_24_a_failure_that_is_none) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) { peer.failure(request.getId(), 0, "all is well"); }),
              "broke the protocol: it answered a failure without a code");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_26_the_answer_to_another_request) {
    EXPECT_EQ(query([](Wire::Request::Reader request, Peer &peer) { peer.done(request.getId() + 1); }),
              "broke the protocol: it answered request 2 instead of 1");
    EXPECT_EQ(code_, code(ErrorCode::ProtocolError));
}

TEST_F(HostileReplies, fault_26_the_next_request_does_not_see_the_rest_of_a_broken_answer) {
    FakeDaemon daemon(socket(), [](Wire::Request::Reader request, Peer &peer) {
        if (request.isGetStorageContainer()) {
            peer.reply(
                request.getId(), [](Wire::Reply::Builder reply) { reply.initPong(); }, false);
            peer.reply(request.getId(), [](Wire::Reply::Builder reply) { reply.initPong(); });
        } else {
            peer.done(request.getId());
        }
    });
    ASSERT_TRUE(LumoLib_Init(0, 0));
    StorageContainerResult *result = nullptr;
    EXPECT_EQ(LumoLib_GetStorageContainer(1, nullptr, &result).code, code(ErrorCode::ProtocolError));
    EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(true));
    EXPECT_EQ(daemon.connections(), 2);
}

} // namespace LumoTest
