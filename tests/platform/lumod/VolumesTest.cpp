// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Fixture.h"
#include "Volumes.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;
using testing::HasSubstr;
using Wire::ErrorCode;

class VolumesTest : public DaemonFixture {
protected:
    VolumesTest()
        : vendor_(addUsualVendor()) {}

    static Fill creation(std::string const &name, std::string const &policy = {}, int64_t sizeMb = 0) {
        return [=](Wire::Request::Builder request) {
            auto create = request.initCreateVirtualVolume();
            create.setContainerId(containerIdOf(1).c_str());
            create.setDirectoryName(kj::StringPtr(name.data(), name.size()));
            create.setPolicy(policy.c_str());
            create.setSizeMb(sizeMb);
            create.setVmUuid("vm-uuid");
        };
    }
    Reply create(std::string const &name, std::string const &policy = {}, int64_t sizeMb = 0) {
        return ask(creation(name, policy, sizeMb));
    }
    std::optional<std::string> profileOfNew(std::string const &name, std::string const &policy) {
        Reply const reply = create(name, policy);
        return vendor_->volumes.at(reply.only().getVolume().getUuid().cStr()).profile;
    }
    std::string boundTo(std::string const &uuid) {
        return vendor_->volumes.at(uuid).boundTo.value_or("");
    }

    std::shared_ptr<FakeVendor> vendor_;
};

TEST_F(VolumesTest, CreationMakesAConfigVolume) {
    Reply const reply = create("vm-1", "", 100);
    std::string const uuid = reply.only().getVolume().getUuid().cStr();
    Orka::VirtualVolume const &volume = vendor_->volumes.at(uuid);
    EXPECT_EQ(volume.kind, Orka::VolumeKind::Config);
    EXPECT_EQ(volume.directoryName, "vm-1");
    EXPECT_EQ(volume.sizeMb, 100);
    EXPECT_EQ(volume.vmUuid, "vm-uuid");
    EXPECT_STREQ(reply.only().getVolume().getEndpoint().cStr(), "");
}

TEST_F(VolumesTest, EveryChangeCarriesAKeyOfItsOwnAndQueriesCarryNone) {
    create("vm-1");
    create("vm-2");
    std::vector<std::string> keys;
    for (Orka::CallContext const &context : vendor_->contexts) {
        if (!context.idempotencyKey.empty()) {
            keys.push_back(context.idempotencyKey);
        }
    }
    EXPECT_THAT(keys, ElementsAre("key-1", "key-2"));
}

TEST_F(VolumesTest, fault_53_ADirectoryNameIsOnePathComponent) {
    for (std::string const &bad :
         {std::string("."), std::string(".."), std::string("a/b"), std::string("/"), std::string("a\nb"),
          std::string("a\0b", 3), std::string("\x7f"), std::string("a\xc2\x9b"), std::string("\xff"),
          std::string(256, 'n'), std::string()}) {
        EXPECT_EQ(create(bad).code(), ErrorCode::InvalidArgument) << testing::PrintToString(bad);
    }
    EXPECT_EQ(vendor_->count("createVirtualVolume"), 0);
    for (std::string const &good :
         {std::string("..."), std::string("a b"), std::string("\xc3\xa4"), std::string(255, 'n')}) {
        EXPECT_EQ(create(good).code(), ErrorCode::Success) << good;
    }
}

TEST_F(VolumesTest, SizesAreChecked) {
    EXPECT_EQ(create("a", "", -1).code(), ErrorCode::InvalidArgument);
    Reply const large = create("a", "", (1 << 20) + 1);
    EXPECT_EQ(large.code(), ErrorCode::TooLarge);
    EXPECT_THAT(large.sentence(), HasSubstr("1048577"));
    EXPECT_EQ(create("a", "", 1 << 20).code(), ErrorCode::Success);
}

TEST_F(VolumesTest, TheProfileTellsHowToAllocateWhileManipulationIsEnabled) {
    EXPECT_EQ(profileOfNew("a", "gold"), "gold;alloctype=thin");
    EXPECT_EQ(profileOfNew("b", "gold;"), "gold;alloctype=thin");
    EXPECT_EQ(profileOfNew("c", "gold;alloctype=thick"), "gold;alloctype=thick");
    EXPECT_EQ(profileOfNew("d", ""), std::nullopt);
    ask([](Wire::Request::Builder request) { request.setSetSpaceEfficiencyManipulationEnabled(false); });
    EXPECT_EQ(profileOfNew("e", "gold"), "gold");
    ask([](Wire::Request::Builder request) { request.setSetSpaceEfficiencyManipulationEnabled(true); });
    EXPECT_EQ(profileOfNew("f", "gold"), "gold;alloctype=thin");
}

TEST_F(VolumesTest, AVolumeIsBoundThroughTheFirstAccessibleEndpoint) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    store_.setEndpointOutage("e1", true);
    Reply const reply = volumeRequest("bind", uuid);
    EXPECT_STREQ(reply.only().getVolume().getEndpoint().cStr(), "e2");
    EXPECT_EQ(boundTo(uuid), "e2");
}

TEST_F(VolumesTest, ABoundVolumeKeepsItsEndpointWhileThatIsUsable) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    vendor_->volumes.at(uuid).boundTo = "e2";
    EXPECT_STREQ(volumeRequest("bind", uuid).only().getVolume().getEndpoint().cStr(), "e2");
    EXPECT_EQ(vendor_->count("bindVirtualVolume"), 0);
    store_.setEndpointOutage("e2", true);
    EXPECT_STREQ(volumeRequest("bind", uuid).only().getVolume().getEndpoint().cStr(), "e1");
    EXPECT_EQ(boundTo(uuid), "e1");
}

TEST_F(VolumesTest, WithoutAnAccessibleEndpointNothingIsChanged) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    vendor_->volumes.at(uuid).boundTo = "e1";
    store_.setEndpointOutage("e1", true);
    store_.setEndpointOutage("e2", true);
    EXPECT_EQ(volumeRequest("bind", uuid).code(), ErrorCode::NoAccessibleEndpoint);
    EXPECT_EQ(boundTo(uuid), "e1");
}

TEST_F(VolumesTest, EndpointsThatWentMeanwhileAreTriedToTheLast) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    vendor_->failing.emplace("bindVirtualVolume", Wire::Failure(ErrorCode::NoAccessibleEndpoint, "it went"));
    Reply const reply = volumeRequest("bind", uuid);
    EXPECT_EQ(reply.code(), ErrorCode::NoAccessibleEndpoint);
    EXPECT_EQ(reply.sentence(), "the virtual volume " + uuid +
                                    " cannot be bound: no protocol endpoint of the storage container " +
                                    containerIdOf(1) + " is accessible");
    EXPECT_EQ(vendor_->count("bindVirtualVolume " + uuid + " e1"), 1);
    EXPECT_EQ(vendor_->count("bindVirtualVolume " + uuid + " e2"), 1);
}

TEST_F(VolumesTest, AVolumeIsNamedByDirectoryNameToo) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    EXPECT_STREQ(volumeRequest("bind", "", "vm").only().getVolume().getUuid().cStr(), uuid.c_str());
    Reply const unknown = volumeRequest("bind", "", "other");
    EXPECT_EQ(unknown.code(), ErrorCode::NoSuchVolume);
    EXPECT_THAT(unknown.sentence(), HasSubstr("'other'"));
    EXPECT_EQ(volumeRequest("bind", "", "a/b").code(), ErrorCode::InvalidArgument);
}

TEST_F(VolumesTest, OtherSpellingsOfAUuidNameTheSameVolume) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    EXPECT_EQ(volumeRequest("info", "{" + uuid + "}").code(), ErrorCode::Success);
    EXPECT_EQ(volumeRequest("info", "nonsense").code(), ErrorCode::NoSuchVolume);
}

TEST_F(VolumesTest, DeletionUnbindsFirst) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    vendor_->volumes.at(uuid).boundTo = "e1";
    Reply const reply = volumeRequest("delete", uuid);
    EXPECT_STREQ(reply.only().getVolume().getDirectoryName().cStr(), "vm");
    EXPECT_TRUE(vendor_->volumes.empty());
    EXPECT_EQ(volumeRequest("delete", uuid).code(), ErrorCode::NoSuchVolume);
}

TEST_F(VolumesTest, OrderedChangesTakeTurnsInTheOrderOfComing) {
    vendor_->hanging.insert("createVirtualVolume");
    Pending first = start(creation("first"));
    Pending second = start(creation("second"));
    EXPECT_FALSE(second.promise.poll(scope_));
    EXPECT_EQ(vendor_->count("createVirtualVolume"), 1);
    vendor_->answer();
    finish(kj::mv(first));
    EXPECT_FALSE(second.promise.poll(scope_));
    EXPECT_EQ(vendor_->count("createVirtualVolume second"), 1);
    vendor_->answer();
    EXPECT_EQ(finish(kj::mv(second)).code(), ErrorCode::Success);
}

TEST_F(VolumesTest, fault_61_PriorityIsServedWhileTheOrderedQueueIsStuck) {
    std::string const uuid = vendor_->addVolume(containerIdOf(1), "vm");
    vendor_->hanging.insert("createVirtualVolume");
    Pending stuck = start(creation("stuck"));
    EXPECT_FALSE(stuck.promise.poll(scope_));
    Pending behind = start(volumeFill("bind", uuid));
    EXPECT_FALSE(behind.promise.poll(scope_));
    EXPECT_EQ(volumeRequest("bind", uuid, {}, false).code(), ErrorCode::Success);
    EXPECT_EQ(volumeRequest("info", uuid).code(), ErrorCode::Success) << "reads do not stand in the queue";
    vendor_->answer();
    finish(kj::mv(stuck));
    EXPECT_EQ(finish(kj::mv(behind)).code(), ErrorCode::Success);
}

TEST_F(VolumesTest, AnAbandonedChangeLetsTheNextOneHaveItsTurn) {
    vendor_->hanging.insert("createVirtualVolume");
    {
        Pending abandoned = start(creation("abandoned"));
        EXPECT_FALSE(abandoned.promise.poll(scope_));
    }
    vendor_->hanging.clear();
    EXPECT_EQ(create("next").code(), ErrorCode::Success);
}

TEST_F(VolumesTest, AnInjectedFaultTakesTheOperationsPlace) {
    ask([](Wire::Request::Builder request) {
        auto rule = request.initAddFaultInjectionRule();
        rule.setFault("OUT_OF_RESOURCE");
        rule.setOperation("createVirtualVolume");
        rule.setFrequency(2);
        rule.setTimeMs(-1);
    });
    ask([](Wire::Request::Builder request) { request.setSetFaultInjectionEnabled(true); });
    EXPECT_EQ(create("a").code(), ErrorCode::Success);
    Reply const struck = create("b");
    EXPECT_EQ(struck.code(), ErrorCode::FaultOutOfResource);
    EXPECT_EQ(struck.sentence(), "injected fault OUT_OF_RESOURCE in createVirtualVolume of provider 'vp'");
    EXPECT_EQ(vendor_->count("createVirtualVolume"), 1) << "the provider was not asked";
    EXPECT_TRUE(sink_.holds("trace-1 injected fault OUT_OF_RESOURCE"));
    ask([](Wire::Request::Builder request) {
        auto rule = request.initModifyFaultInjectionRule();
        rule.setFault("OUT_OF_RESOURCE");
        rule.setOperation("createVirtualVolume");
        rule.setFrequency(-1);
        rule.setTimeMs(-1);
    });
    EXPECT_EQ(create("b").code(), ErrorCode::Success);
}

TEST_F(VolumesTest, AFaultRuleIsChangedByEitherOfItsNumbersAndRemovedByNone) {
    auto const rule = [](Wire::FaultInjectionRule::Builder builder, int32_t frequency, int32_t timeMs) {
        builder.setFault("RESOURCE_BUSY");
        builder.setOperation("bindVirtualVolume");
        builder.setFrequency(frequency);
        builder.setTimeMs(timeMs);
    };
    ask([&](Wire::Request::Builder request) { rule(request.initAddFaultInjectionRule(), 2, -1); });
    std::string const subject = "the fault rule RESOURCE_BUSY for bindVirtualVolume";
    EXPECT_TRUE(sink_.holds("added " + subject + ": frequency 2, time -1 ms"));
    for (auto const &[frequency, timeMs] : {std::pair{3, -1}, std::pair{-1, 500}, std::pair{3, 500}}) {
        ask([&, each = frequency, limit = timeMs](Wire::Request::Builder request) {
            rule(request.initModifyFaultInjectionRule(), each, limit);
        });
        EXPECT_TRUE(sink_.holds("changed " + subject + ": frequency " + std::to_string(frequency) + ", time " +
                                std::to_string(timeMs) + " ms"));
    }
    ask([&](Wire::Request::Builder request) { rule(request.initModifyFaultInjectionRule(), -1, -1); });
    EXPECT_TRUE(sink_.holds("removed " + subject));
}

} // namespace
