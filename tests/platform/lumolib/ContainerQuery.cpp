// SPDX-License-Identifier: Apache-2.0
#include <malloc.h>

#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

using Wire::ErrorCode;

class ContainerQuery : public Host {
protected:
    StorageContainerResult *query(FakeDaemon::Handler handler) {
        daemon_ = std::make_unique<FakeDaemon>(socket(), std::move(handler));
        EXPECT_TRUE(LumoLib_Init(0, 0));
        StorageContainerResult *result = nullptr;
        error_ = LumoLib_GetStorageContainer(1, nullptr, &result);
        return result;
    }

    std::unique_ptr<FakeDaemon> daemon_;
    LumoErrorEx error_{};
};

void fillContainer(Wire::StorageContainer::Builder container, std::string const &id,
                   std::initializer_list<std::uint32_t> arrays) {
    container.setId(id.c_str());
    container.setName(("name of " + id).c_str());
    container.setProviderUrl("https://vp/orka");
    container.setMaxLumoSizeMb(1024);
    capnp::List<std::uint32_t>::Builder places = container.initArrays(static_cast<unsigned>(arrays.size()));
    unsigned next = 0;
    for (std::uint32_t const place : arrays) {
        places.set(next++, place);
    }
}

void fillArrays(Wire::Reply::Builder reply) {
    capnp::List<Wire::StorageArray>::Builder arrays = reply.initStorageArrays(2);
    arrays[0].setId("array0");
    arrays[0].setName("Array 0");
    arrays[0].setVendorId("vendor");
    arrays[0].setModelId("model");
    capnp::List<Wire::Endpoint>::Builder endpoints = arrays[0].initEndpoints(3);
    endpoints[0].setUid("pe0");
    endpoints[0].setType(0);
    endpoints[0].setText1("lun7");
    endpoints[0].setIsAccessible(true);
    endpoints[1].setType(1);
    endpoints[1].setText1("10.0.0.1");
    endpoints[1].setText2("/export");
    endpoints[1].setIsConfigured(true);
    endpoints[2].setUid("");
    endpoints[2].setType(2);
    capnp::List<capnp::Text>::Builder addresses = endpoints[2].initAddresses(2);
    addresses.set(0, "10.0.0.2");
    arrays[1].setId("array1");
}

/// Two containers on two arrays, then a third one in a reply of its own.
void answerThreeContainers(Wire::Request::Reader request, Peer &peer) {
    ASSERT_TRUE(request.isGetStorageContainer());
    peer.reply(request.getId(), fillArrays, false);
    peer.reply(
        request.getId(),
        [](Wire::Reply::Builder reply) {
            capnp::List<Wire::StorageContainer>::Builder containers = reply.initStorageContainers(2);
            fillContainer(containers[0], "c0", {0, 1});
            fillContainer(containers[1], "c1", {1});
        },
        false);
    peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
        fillContainer(reply.initStorageContainers(1)[0], "c2", {1, 0});
    });
}

TEST_F(ContainerQuery, hands_out_containers_of_all_chunks_in_order) {
    StorageContainerResult *result = query(answerThreeContainers);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error_));
    EXPECT_STREQ(LumoLib_ErrorExStr(&error_), "success");
    ASSERT_EQ(result->containerCount, 3U);
    EXPECT_STREQ(result->containers[0]->id, "c0");
    EXPECT_STREQ(result->containers[0]->name, "name of c0");
    EXPECT_STREQ(result->containers[0]->providerUrl, "https://vp/orka");
    EXPECT_EQ(result->containers[0]->maxLumoSizeMb, 1024);
    EXPECT_STREQ(result->containers[1]->id, "c1");
    EXPECT_STREQ(result->containers[2]->id, "c2");
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, lets_containers_share_the_records_of_an_array) {
    StorageContainerResult *result = query(answerThreeContainers);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error_));
    StorageContainerInfo **containers = result->containers;
    ASSERT_EQ(containers[0]->arrayCount, 2);
    ASSERT_EQ(containers[1]->arrayCount, 1);
    ASSERT_EQ(containers[2]->arrayCount, 2);
    EXPECT_STREQ(containers[0]->arrays[0]->arrayId, "array0");
    EXPECT_STREQ(containers[0]->arrays[1]->arrayId, "array1");
    EXPECT_EQ(containers[1]->arrays[0], containers[0]->arrays[1]);
    EXPECT_EQ(containers[2]->arrays[0], containers[0]->arrays[1]);
    EXPECT_EQ(containers[2]->arrays[1], containers[0]->arrays[0]);
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, tells_arrays_and_endpoints_with_nulls_only_where_they_are_allowed) {
    StorageContainerResult *result = query(answerThreeContainers);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error_));
    StorageArrayInfo const &array = *result->containers[0]->arrays[0];
    EXPECT_STREQ(array.name, "Array 0");
    EXPECT_STREQ(array.vendorId, "vendor");
    EXPECT_STREQ(array.modelId, "model");
    ASSERT_EQ(array.endpointCount, 3);
    ProtocolEndpointInfo const &scsi = *array.endpoints[0];
    EXPECT_STREQ(scsi.localUID, "pe0");
    EXPECT_EQ(scsi.transport->type, EndpointTransportScsi);
    EXPECT_STREQ(scsi.transport->text1, "lun7");
    EXPECT_EQ(scsi.transport->text2, nullptr);
    EXPECT_EQ(scsi.nfs4xAddressCount, 0);
    EXPECT_EQ(scsi.isAccessible, 1);
    EXPECT_EQ(scsi.isConfigured, 0);
    ProtocolEndpointInfo const &nfs = *array.endpoints[1];
    EXPECT_EQ(nfs.localUID, nullptr);
    EXPECT_EQ(nfs.transport->type, EndpointTransportNfs);
    EXPECT_STREQ(nfs.transport->text1, "10.0.0.1");
    EXPECT_STREQ(nfs.transport->text2, "/export");
    EXPECT_EQ(nfs.isAccessible, 0);
    EXPECT_EQ(nfs.isConfigured, 1);
    ProtocolEndpointInfo const &nfs4x = *array.endpoints[2];
    EXPECT_STREQ(nfs4x.localUID, "");
    EXPECT_EQ(nfs4x.transport->type, EndpointTransportNfs4x);
    EXPECT_EQ(nfs4x.transport->text1, nullptr);
    ASSERT_EQ(nfs4x.nfs4xAddressCount, 2);
    EXPECT_STREQ(nfs4x.nfs4xAddresses[0], "10.0.0.2");
    EXPECT_STREQ(nfs4x.nfs4xAddresses[1], "");
    StorageArrayInfo const &bare = *result->containers[0]->arrays[1];
    EXPECT_STREQ(bare.name, "");
    EXPECT_STREQ(bare.vendorId, "");
    EXPECT_STREQ(bare.modelId, "");
    EXPECT_EQ(bare.endpointCount, 0);
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, a_container_that_tells_nothing_has_empty_texts) {
    StorageContainerResult *result = query([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) { reply.initStorageContainers(1); });
    });
    ASSERT_EQ(result->containerCount, 1U);
    EXPECT_STREQ(result->containers[0]->id, "");
    EXPECT_STREQ(result->containers[0]->name, "");
    EXPECT_STREQ(result->containers[0]->providerUrl, "");
    EXPECT_EQ(result->containers[0]->arrayCount, 0);
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, no_containers_are_an_empty_result) {
    StorageContainerResult *result = query(answerDone);
    EXPECT_TRUE(LumoLib_ErrorExIsSuccess(&error_));
    ASSERT_NE(result, nullptr);
    EXPECT_EQ(result->containerCount, 0U);
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, keeps_urls_apart_that_differ) {
    StorageContainerResult *result = query([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
            capnp::List<Wire::StorageContainer>::Builder containers = reply.initStorageContainers(4);
            containers[0].setProviderUrl("https://a");
            containers[1].setProviderUrl("https://a");
            containers[2].setProviderUrl("https://b");
        });
    });
    ASSERT_EQ(result->containerCount, 4U);
    EXPECT_EQ(result->containers[0]->providerUrl, result->containers[1]->providerUrl);
    EXPECT_STREQ(result->containers[1]->providerUrl, "https://a");
    EXPECT_STREQ(result->containers[2]->providerUrl, "https://b");
    EXPECT_STREQ(result->containers[3]->providerUrl, "");
    LumoLib_FreeStorageContainerResult(result);
}

TEST_F(ContainerQuery, a_failure_hands_out_nothing_and_tells_the_particular_sentence) {
    StorageContainerResult *result = query([](Wire::Request::Reader request, Peer &peer) {
        peer.failure(request.getId(), code(ErrorCode::ProviderOffline), "the provider vp is offline");
    });
    EXPECT_EQ(result, nullptr);
    EXPECT_FALSE(LumoLib_ErrorExIsSuccess(&error_));
    EXPECT_STREQ(LumoLib_ErrorExStr(&error_), "the provider vp is offline");
    EXPECT_EQ(lastFailure(), "31: the provider vp is offline");
}

TEST_F(ContainerQuery, a_failure_whose_sentence_says_nothing_gets_the_general_one) {
    for (std::string const &sentence : {std::string(), std::string("\0hidden", 7)}) {
        query([&](Wire::Request::Reader request, Peer &peer) {
            peer.failure(request.getId(), code(ErrorCode::ProviderOffline), sentence);
        });
        EXPECT_STREQ(LumoLib_ErrorExStr(&error_), Wire::textOf(code(ErrorCode::ProviderOffline)));
        LumoLib_Exit();
        daemon_.reset();
    }
}

TEST_F(ContainerQuery, a_failure_after_some_chunks_hands_out_nothing_and_keeps_the_connection) {
    int requests = 0;
    StorageContainerResult *result = query([&requests](Wire::Request::Reader request, Peer &peer) {
        if (requests++ == 0) {
            peer.reply(request.getId(), fillArrays, false);
            peer.failure(request.getId(), code(ErrorCode::ProviderUnreachable), "vp does not answer");
        } else {
            peer.done(request.getId());
        }
    });
    EXPECT_EQ(result, nullptr);
    EXPECT_STREQ(LumoLib_ErrorExStr(&error_), "vp does not answer");
    EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(true));
    EXPECT_EQ(daemon_->connections(), 1);
}

TEST_F(ContainerQuery, a_long_sentence_is_cut_at_a_whole_character) {
    std::string const start(250, 'x');
    query([&](Wire::Request::Reader request, Peer &peer) {
        peer.failure(request.getId(), 7, start + "\xC3\xA4 and on");
    });
    EXPECT_EQ(LumoLib_ErrorExStr(&error_), start);
    EXPECT_EQ(lastFailure(), "7: " + start + "\xC3\xA4 and on");
}

/// As many containers as a large site has, a chunk a reply.
void answerManyContainers(Wire::Request::Reader request, Peer &peer) {
    peer.reply(request.getId(), fillArrays, false);
    constexpr unsigned chunks = 30;
    for (unsigned chunk = 0; chunk < chunks; ++chunk) {
        peer.reply(
            request.getId(),
            [chunk](Wire::Reply::Builder reply) {
                capnp::List<Wire::StorageContainer>::Builder containers = reply.initStorageContainers(1000);
                for (unsigned place = 0; place < 1000; ++place) {
                    fillContainer(containers[place], "container-" + std::to_string(1000 * chunk + place) + "-of-many",
                                  {0, 1});
                }
            },
            chunk + 1 == chunks);
    }
}

TEST_F(ContainerQuery, takes_little_more_memory_than_its_records) {
    daemon_ = std::make_unique<FakeDaemon>(socket(), answerManyContainers);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    StorageContainerResult *result = nullptr;
    struct mallinfo2 const before = mallinfo2();
    error_ = LumoLib_GetStorageContainer(1, nullptr, &result);
    ASSERT_TRUE(LumoLib_ErrorExIsSuccess(&error_));
    ASSERT_EQ(result->containerCount, 30000U);
    EXPECT_STREQ(result->containers[29999]->id, "container-29999-of-many");
    struct mallinfo2 const after = mallinfo2();
    std::size_t records = 0;
    for (unsigned place = 0; place < result->containerCount; ++place) {
        StorageContainerInfo const &container = *result->containers[place];
        records += sizeof container + sizeof(StorageContainerInfo *) + std::string(container.id).size() + 1 +
                   std::string(container.name).size() + 1;
    }
    LumoLib_FreeStorageContainerResult(result);
    std::size_t const used = after.uordblks + after.hblkhd - before.uordblks - before.hblkhd;
    // The daemon's thread has a heap of its own; a sanitizer's allocator does not count here at all.
    if (after.uordblks + after.hblkhd > 0) {
        EXPECT_LT(static_cast<double>(used), 1.3 * static_cast<double>(records));
    }
}

} // namespace LumoTest
