// SPDX-License-Identifier: Apache-2.0
//
// Each function of the C interface: what the daemon is asked, and what becomes of its answer.
#include <cstdlib>
#include <cstring>

#include "FakeDaemon.h"
#include "Host.h"

namespace LumoTest {

using Wire::ErrorCode;

class Requests : public Host {
protected:
    /// Starts a daemon with the handler and opens a session.
    FakeDaemon &serve(FakeDaemon::Handler handler) {
        daemon_ = std::make_unique<FakeDaemon>(socket(), std::move(handler));
        EXPECT_TRUE(LumoLib_Init(0, 0));
        return *daemon_;
    }

    /// One reply to whatever is asked.
    FakeDaemon &answer(std::function<void(Wire::Reply::Builder)> fill) {
        return serve([fill](Wire::Request::Reader request, Peer &peer) { peer.reply(request.getId(), fill); });
    }

    std::string asked() const {
        return daemon_->asked().empty() ? "nothing" : daemon_->asked().back();
    }

    std::unique_ptr<FakeDaemon> daemon_;
};

TEST_F(Requests, activate_a_provider) {
    serve(answerDone);
    char block[64] = {};
    EXPECT_EQ(LumoLib_ActivateProvider("array", "vp", "https://vp", block), 0);
    EXPECT_EQ(asked(), R"((traceId = "", activateProvider = (arrayId = "array", providerName = "vp", )"
                       R"(activeProviderUrl = "https://vp")))");
    EXPECT_EQ(LumoLib_ActivateProvider("array", "vp", "", block), 0);
    EXPECT_EQ(asked(), R"((traceId = "", activateProvider = (arrayId = "array", providerName = "vp", )"
                       R"(activeProviderUrl = "")))");
}

TEST_F(Requests, deactivate_a_provider) {
    serve(answerDone);
    EXPECT_EQ(LumoLib_DeactivateProvider("array", "vp"), 0);
    EXPECT_EQ(asked(), R"((traceId = "", deactivateProvider = (arrayId = "array", providerName = "vp")))");
}

TEST_F(Requests, a_null_text_counts_as_empty) {
    serve(answerDone);
    EXPECT_EQ(LumoLib_DeactivateProvider(nullptr, nullptr), 0);
    EXPECT_EQ(asked(), R"((traceId = "", deactivateProvider = (arrayId = "", providerName = "")))");
}

TEST_F(Requests, inject_a_providers_fault) {
    serve(answerDone);
    LumoArrayFault entries[] = {{"a1", 1, nullptr}, {"a2", 0, nullptr}};
    EXPECT_EQ(LumoLib_VendorProviderInjectFault("vp", "url", "offline", 2, entries), 0);
    EXPECT_EQ(asked(), R"((traceId = "", vendorProviderInjectFault = (providerName = "vp", providerUrl = "url", )"
                       R"(status = "offline", arrays = [(arrayId = "a1", isActive = true), )"
                       R"((arrayId = "a2", isActive = false)])))");
    EXPECT_EQ(LumoLib_VendorProviderInjectFault("vp", "url", "default", 0, nullptr), 0);
    EXPECT_EQ(asked(), R"((traceId = "", vendorProviderInjectFault = (providerName = "vp", providerUrl = "url", )"
                       R"(status = "default", arrays = [])))");
}

TEST_F(Requests, refuse_counts_of_array_entries_that_cannot_be) {
    serve(answerDone);
    LumoArrayFault entry{"a", 1, nullptr};
    EXPECT_EQ(LumoLib_VendorProviderInjectFault("vp", "url", "", -1, &entry), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_VendorProviderInjectFault("vp", "url", "", 1, nullptr), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_VendorProviderInjectFault("vp", "url", "", INT32_MAX, &entry), code(ErrorCode::MessageTooLarge));
    EXPECT_EQ(asked(), "nothing");
}

TEST_F(Requests, switch_fault_rules) {
    serve(answerDone);
    EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(false));
    EXPECT_EQ(asked(), R"((traceId = "", setFaultInjectionEnabled = false))");
    EXPECT_TRUE(LumoLib_AddFaultInjectionRule("TIMEOUT", "*", 3, -1));
    EXPECT_EQ(asked(), R"((traceId = "", addFaultInjectionRule = (fault = "TIMEOUT", operation = "*", frequency = 3, )"
                       R"(timeMs = -1)))");
    EXPECT_TRUE(LumoLib_ModifyFaultInjectionRule("TIMEOUT", "bindVirtualVolume", -1, -1));
    EXPECT_EQ(asked(), R"((traceId = "", modifyFaultInjectionRule = (fault = "TIMEOUT", )"
                       R"(operation = "bindVirtualVolume", frequency = -1, timeMs = -1)))");
}

TEST_F(Requests, a_refused_rule_is_false_and_noted) {
    serve([](Wire::Request::Reader request, Peer &peer) {
        peer.failure(request.getId(), code(ErrorCode::RuleExists), "the rule TIMEOUT on * exists");
    });
    EXPECT_FALSE(LumoLib_AddFaultInjectionRule("TIMEOUT", "*", 3, -1));
    EXPECT_EQ(lastFailure(), "63: the rule TIMEOUT on * exists");
}

TEST_F(Requests, debug_command_leaves_out_what_is_null) {
    serve(answerDone);
    std::int32_t const level = 16;
    std::int32_t const dump = 1;
    std::int32_t const period = 0;
    EXPECT_EQ(LumoLib_DebugCommand(&level, &dump, &period), 0);
    EXPECT_EQ(asked(), R"((traceId = "", debugCommand = (logLevel = 16, dump = 1, unbindPeriodUs = 0)))");
    EXPECT_EQ(LumoLib_DebugCommand(nullptr, nullptr, &period), 0);
    EXPECT_EQ(asked(), R"((traceId = "", debugCommand = (logLevel = -1, dump = -1, unbindPeriodUs = 0)))");
}

TEST_F(Requests, debug_command_refuses_negative_settings) {
    serve(answerDone);
    std::int32_t const period = -5;
    EXPECT_EQ(LumoLib_DebugCommand(nullptr, nullptr, &period), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(lastFailure(), "20: the unbind period must not be negative: -5");
    EXPECT_EQ(asked(), "nothing");
}

TEST_F(Requests, switch_space_efficiency) {
    serve(answerDone);
    EXPECT_EQ(LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(1), 0);
    EXPECT_EQ(asked(), R"((traceId = "", setSpaceEfficiencyManipulationEnabled = true))");
    EXPECT_EQ(LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(0), 0);
    EXPECT_EQ(asked(), R"((traceId = "", setSpaceEfficiencyManipulationEnabled = false))");
}

TEST_F(Requests, space_statistics_of_a_volume) {
    answer([](Wire::Reply::Builder reply) {
        Wire::SpaceStats::Builder stats = reply.initSpaceStats();
        stats.setLogicalSizeMb(4096);
        stats.setCommittedSizeMb(1024);
        stats.setUnsharedSizeMb(512);
        stats.setUnsharedSizeValid(true);
    });
    LumoSpaceStats *stats = nullptr;
    ASSERT_EQ(LumoLib_SpaceStatsForLumo("{0A1B2C3D4E5F60718293A4B5C6D7E8F9}", volumeId, &stats), 0);
    EXPECT_EQ(asked(), R"((traceId = "", spaceStatsForLumo = (containerId = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9", )"
                       R"(uuid = "11111111-2222-3333-4444-555555555555")))");
    EXPECT_EQ(stats->logicalSize, 4096);
    EXPECT_EQ(stats->committedSize, 1024);
    EXPECT_EQ(stats->unsharedSize, 512);
    EXPECT_EQ(stats->unsharedSizeValid, 1);
    LumoLib_FreeLumoSpaceStatsInfo(stats);
}

TEST_F(Requests, storage_profile_of_a_volume) {
    answer([](Wire::Reply::Builder reply) { reply.initLumoInfo().setStorageProfile("gold"); });
    LumoInfo *info = nullptr;
    ASSERT_EQ(LumoLib_GetLumoInfo(containerId, volumeId, &info), 0);
    EXPECT_STREQ(info->storageProfile, "gold");
    LumoLib_FreeLumoInfo(info);
}

TEST_F(Requests, a_volume_without_a_storage_profile_has_a_null_one) {
    answer([](Wire::Reply::Builder reply) { reply.initLumoInfo(); });
    LumoInfo *info = nullptr;
    ASSERT_EQ(LumoLib_GetLumoInfo(containerId, volumeId, &info), 0);
    EXPECT_EQ(info->storageProfile, nullptr);
    LumoLib_FreeLumoInfo(info);
}

TEST_F(Requests, an_empty_storage_profile_is_an_empty_text) {
    answer([](Wire::Reply::Builder reply) { reply.initLumoInfo().setStorageProfile(""); });
    LumoInfo *info = nullptr;
    ASSERT_EQ(LumoLib_GetLumoInfo(containerId, volumeId, &info), 0);
    EXPECT_STREQ(info->storageProfile, "");
    LumoLib_FreeLumoInfo(info);
}

TEST_F(Requests, unshared_chunks_of_a_volume_are_one_block_for_free) {
    std::string const bitmap = "\xff\x01";
    answer([&](Wire::Reply::Builder reply) {
        Wire::UnsharedChunks::Builder chunks = reply.initUnsharedChunks();
        chunks.setBlockSize(65536);
        chunks.setBitmap(kj::arrayPtr(reinterpret_cast<kj::byte const *>(bitmap.data()), bitmap.size()));
    });
    LumoUnsharedChunks *chunks = nullptr;
    ASSERT_EQ(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, &chunks), 0);
    EXPECT_EQ(chunks->blockSize, 65536);
    EXPECT_EQ(chunks->chunkCount, 16);
    EXPECT_EQ(std::memcmp(chunks + 1, bitmap.data(), bitmap.size()), 0);
    std::free(chunks);
}

TEST_F(Requests, metadata_keeps_order_and_duplicates) {
    serve([](Wire::Request::Reader request, Peer &peer) {
        auto const fill = [](Wire::Reply::Builder reply, char const *key, char const *value) {
            capnp::List<Wire::MetadataPair>::Builder pairs = reply.initMetadata(2);
            pairs[0].setKey(key);
            pairs[0].setValue(value);
            pairs[1].setKey("same");
        };
        peer.reply(
            request.getId(), [&](Wire::Reply::Builder reply) { fill(reply, "b", "1"); }, false);
        peer.reply(request.getId(), [&](Wire::Reply::Builder reply) { fill(reply, "a", "2"); });
    });
    LumoMetadata *metadata = nullptr;
    ASSERT_EQ(LumoLib_GetLumoMetadata(containerId, volumeId, &metadata), 0);
    std::string all;
    for (LumoMetadataEntry const *entry = metadata->first; entry != nullptr; entry = entry->next) {
        all += std::string(entry->key) + "=" + entry->value + ";";
    }
    EXPECT_EQ(all, "b=1;same=;a=2;same=;");
    LumoLib_FreeLumoMetadata(metadata);
}

TEST_F(Requests, a_volume_without_metadata_has_an_empty_list) {
    answer([](Wire::Reply::Builder reply) { reply.initMetadata(0); });
    LumoMetadata *metadata = nullptr;
    ASSERT_EQ(LumoLib_GetLumoMetadata(containerId, volumeId, &metadata), 0);
    EXPECT_EQ(metadata->first, nullptr);
    LumoLib_FreeLumoMetadata(metadata);
}

/// Answers as many config volumes as are there, whatever was asked for.
void answerThreeVolumes(Wire::Request::Reader request, Peer &peer) {
    auto const fill = [](Wire::Reply::Builder reply, int first, int count) {
        capnp::List<Wire::ConfigLumo>::Builder lumos = reply.initConfigLumos(static_cast<unsigned>(count));
        for (int place = 0; place < count; ++place) {
            lumos[static_cast<unsigned>(place)].setUuid(("id" + std::to_string(first + place)).c_str());
            lumos[static_cast<unsigned>(place)].setDirectoryName(("vm" + std::to_string(first + place)).c_str());
        }
    };
    peer.reply(
        request.getId(), [&](Wire::Reply::Builder reply) { fill(reply, 0, 2); }, false);
    peer.reply(request.getId(), [&](Wire::Reply::Builder reply) { fill(reply, 2, 1); });
}

std::string entriesOf(LumoQueryResult const *result) {
    std::string all;
    for (int place = 0; place < result->count; ++place) {
        all += std::string(result->entries[place]->id) + "=" + result->entries[place]->directoryName + ";";
    }
    return all;
}

TEST_F(Requests, config_volumes_come_in_order) {
    serve(answerThreeVolumes);
    LumoQueryResult *result = nullptr;
    ASSERT_EQ(LumoLib_QueryAllConfigLumos(containerId, INT32_MAX, 0, &result, 0), 0);
    EXPECT_EQ(asked(), R"((traceId = "", queryAllConfigLumos = (containerId = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9", )"
                       R"(max = 2147483647)))");
    EXPECT_EQ(entriesOf(result), "id0=vm0;id1=vm1;id2=vm2;");
    LumoLib_FreeQueryResult(result);
}

TEST_F(Requests, config_volumes_are_at_most_as_many_as_asked_for) {
    serve(answerThreeVolumes);
    for (int const max : {-1, 0, 1, 2, 3, 4}) {
        LumoQueryResult *result = nullptr;
        ASSERT_EQ(LumoLib_QueryAllConfigLumos(containerId, max, 0, &result, 0), 0);
        EXPECT_EQ(result->count, std::clamp(max, 0, 3));
        LumoLib_FreeQueryResult(result);
    }
    EXPECT_EQ(daemon_->asked()[0], R"((traceId = "", queryAllConfigLumos = )"
                                   R"((containerId = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9", max = 0)))");
}

TEST_F(Requests, refuse_what_is_no_container_id) {
    serve(answerDone);
    LumoInfo *info = nullptr;
    EXPECT_EQ(LumoLib_GetLumoInfo("nonsense", volumeId, &info), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(lastFailure(), "20: 'nonsense' is no container id");
    EXPECT_EQ(LumoLib_GetLumoInfo(nullptr, volumeId, &info), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(info, nullptr);
    EXPECT_EQ(asked(), "nothing");
}

TEST_F(Requests, refuse_to_hand_out_to_nowhere) {
    serve(answerDone);
    EXPECT_EQ(LumoLib_GetLumoInfo(containerId, volumeId, nullptr), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_SpaceStatsForLumo(containerId, volumeId, nullptr), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_GetLumoMetadata(containerId, volumeId, nullptr), code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_UnsharedChunksLumo(containerId, volumeId, 0, 0, 0, 0, 0, nullptr),
              code(ErrorCode::InvalidArgument));
    EXPECT_EQ(LumoLib_QueryAllConfigLumos(containerId, 1, 0, nullptr, 0), code(ErrorCode::InvalidArgument));
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, nullptr);
    EXPECT_FALSE(LumoLib_ErrorExIsSuccess(&error));
    EXPECT_EQ(asked(), "nothing");
}

TEST_F(Requests, a_request_above_the_limit_is_refused_and_the_session_lives_on) {
    serve(answerDone);
    std::string const huge(2000000, 'x');
    EXPECT_EQ(LumoLib_DeactivateProvider(huge.c_str(), "vp"), code(ErrorCode::MessageTooLarge));
    EXPECT_EQ(LumoLib_DeactivateProvider("array", "vp"), 0);
    EXPECT_EQ(daemon_->connections(), 1);
}

TEST_F(Requests, fault_21_an_unknown_method_or_version_is_a_typed_error) {
    serve([](Wire::Request::Reader request, Peer &peer) {
        peer.failure(request.getId(), code(ErrorCode::UnknownMethod), "");
    });
    EXPECT_EQ(LumoLib_DeactivateProvider("array", "vp"), code(ErrorCode::UnknownMethod));
    EXPECT_EQ(lastFailure(), "3: the daemon does not know this request");
}

TEST_F(Requests, fault_25_freeing_nothing_does_nothing) {
    LumoLib_FreeStorageContainerResult(nullptr);
    LumoLib_FreeQueryResult(nullptr);
    LumoLib_FreeLumoSpaceStatsInfo(nullptr);
    LumoLib_FreeLumoInfo(nullptr);
    LumoLib_FreeLumoMetadata(nullptr);
    EXPECT_EQ(lastFailure(), "none");
}

} // namespace LumoTest
